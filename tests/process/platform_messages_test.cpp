// Posting and receiving between real processes.
#include "platform_fixture.h"

#include <poll.h>
#include <pthread.h>

#include <atomic>
#include <thread>

namespace platform_test {
namespace {

using PlatformMessages = Domain;
using PlatformWithoutDomain = EmptyDomain;

TEST_F(PlatformMessages, EachFailureHasItsOwnResult)
{
    ASSERT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
    const Numbered message;

    const struct {
        const char* what;
        uint32_t pno, size;
        const void* message;
        int32_t result;
    } rows[] = {
        {"header alone", kPno, 16, &message, 0}, {"whole slot", kPno, 1024, &message, 0},
        {"too short", kPno, 15, &message, 3},    {"too long", kPno, 1025, &message, 3},
        {"nothing", kPno, 0, &message, 3},       {"huge", kPno, UINT32_MAX, &message, 3},
        {"null message", kPno, 16, nullptr, 3},  {"nobody", kPno + 1, 16, &message, 1},
        {"number zero", 0, 16, &message, 1},     {"largest number", UINT32_MAX, 16, &message, 1},
    };
    for (const auto& row : rows)
        EXPECT_EQ(_sys_SndMsg(row.pno, row.size, row.message, 0), row.result) << row.what;

    int32_t posted = 0;
    while (post(message) == 0)
        ++posted;
    EXPECT_EQ(post(message), 2);
    EXPECT_NE(std::string(bt_host_error()).find("full"), std::string::npos) << bt_host_error();
    BtHostQueue queue{};
    ASSERT_EQ(bt_host_list_queues(&queue, 1), 1);
    EXPECT_EQ(queue.queued, queue.capacity);
    EXPECT_EQ(queue.posted, static_cast<uint64_t>(posted) + 2);
    EXPECT_EQ(queue.refused, 2U);
    EXPECT_EQ(queue.owner_pid, static_cast<uint32_t>(getpid()));

    EXPECT_EQ(bt_host_release_pno(), 0);
    EXPECT_EQ(post(message), 1);
    EXPECT_EQ(_sys_GetPno(), 0U);
}

TEST_F(PlatformWithoutDomain, EverythingIsRefusedAndSaysWhy)
{
    Numbered message;
    void* address = &message;
    uint32_t size = 0;
    EXPECT_EQ(post(message), -1);
    EXPECT_NE(std::string(bt_host_error()).find(name), std::string::npos) << bt_host_error();
    EXPECT_EQ(receive(&message, 0), -1);
    EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), -1);
    EXPECT_EQ(bt_host_claim_pno(kPno), -1);
    EXPECT_EQ(_sys_CreateSemaphore("L"), 0U);
    EXPECT_NE(_sys_LinkShareData("D", &address, &size), 0);
    EXPECT_EQ(address, nullptr);
    EXPECT_NE(_sys_ReqTimerStart(kPno, 1, 2, 1), 0);
    EXPECT_EQ(bt_host_remove_domain(), -1);

    for (const char* bad : {"a/b", "a.b", "012345678901234567890123456789012", "ü"}) {
        setenv("BT_PLATFORM_DOMAIN", bad, 1);
        EXPECT_EQ(bt_host_create_domain(), -1) << bad;
        EXPECT_NE(std::string(bt_host_error()).find("BT_PLATFORM_DOMAIN"), std::string::npos) << bt_host_error();
    }
}

TEST_F(PlatformMessages, MessageArrivesWholeAndTheRestOfTheBufferIsZero)
{
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    const Numbered sent(0xA5A5A5A5);
    for (const uint32_t size : {16U, 17U, 500U, 1023U, 1024U}) {
        ASSERT_EQ(_sys_SndMsg(kPno, size, &sent, 0), 0);
        uint8_t buffer[1024];
        std::memset(buffer, 0x77, sizeof buffer);
        ASSERT_EQ(_sys_RcvMsg(kPno, sizeof buffer, buffer, 0), 1);
        EXPECT_EQ(std::memcmp(buffer, &sent, size), 0) << size;
        for (uint32_t at = size; at < sizeof buffer; ++at)
            ASSERT_EQ(buffer[at], 0) << "byte " << at << " behind " << size;
    }

    ASSERT_EQ(post(sent), 0);
    uint8_t small[32];
    std::memset(small, 0x77, sizeof small);
    EXPECT_EQ(bt_host_receive(small, 20, 0), 1);
    EXPECT_EQ(small[19], 0xA5);
    EXPECT_EQ(small[20], 0x77);
    EXPECT_EQ(bt_host_receive(small, 15, 0), -1);
    EXPECT_EQ(bt_host_receive(nullptr, 1024, 0), -1);
    EXPECT_EQ(_sys_RcvMsg(kPno + 1, sizeof small, small, 0), -1);
}

TEST_F(PlatformMessages, EachSenderKeepsItsOrder)
{
    constexpr uint32_t kMessages = 3000;
    constexpr uint16_t kSenders = 4; // two processes with two threads each
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);

    const auto send = [](uint16_t sender) {
        for (uint32_t number = 0; number < kMessages; ++number)
            ASSERT_EQ(post_patiently(Numbered(number, sender)), 0) << bt_host_error();
    };
    const auto process = [&send](uint16_t first) {
        std::thread other(send, static_cast<uint16_t>(first + 1));
        send(first);
        other.join();
    };
    Child one([&] { process(0); });
    Child two([&] { process(2); });

    uint32_t next[kSenders] = {};
    Numbered message;
    for (uint32_t count = 0; count < kMessages * kSenders; ++count) {
        ASSERT_EQ(receive(&message, kLongMs), 1);
        ASSERT_TRUE(message.whole());
        ASSERT_LT(message.header.src_pno, kSenders);
        ASSERT_EQ(message.words[0], next[message.header.src_pno]++);
    }
    EXPECT_TRUE(one.succeeded());
    EXPECT_TRUE(two.succeeded());
    EXPECT_EQ(receive(&message, 0), 0);
}

TEST_F(PlatformMessages, SleepingReceiverIsWokenByEachMessage)
{
    Child echo([] {
        ASSERT_EQ(bt_host_claim_pno(kPno + 1), 0);
        Numbered message;
        while (receive(&message, kLongMs) == 1 && message.header.cid == 0)
            ASSERT_EQ(post_patiently(message), 0);
    });
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    Numbered message;
    while (post(message, kPno + 1) == 1)
        sched_yield();
    ASSERT_EQ(receive(&message, kLongMs), 1);
    for (uint32_t number = 0; number < 2000; ++number) {
        ASSERT_EQ(post(Numbered(number), kPno + 1), 0);
        ASSERT_EQ(receive(&message, kLongMs), 1);
        ASSERT_EQ(message.words[0], number);
    }
    message.header.cid = 1;
    EXPECT_EQ(post(message, kPno + 1), 0);
    EXPECT_TRUE(echo.succeeded());
}

TEST_F(PlatformMessages, SignalEndsTheWait)
{
    struct sigaction action {};
    struct sigaction before {};
    action.sa_handler = [](int) {};
    action.sa_flags = SA_RESTART;
    ASSERT_EQ(sigaction(SIGUSR1, &action, &before), 0);

    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    std::atomic<bool> ended{false};
    const pthread_t receiver = pthread_self();
    std::thread nudge([&] {
        while (!ended) { // the signal may come before the wait begins
            pthread_kill(receiver, SIGUSR1);
            sched_yield();
        }
    });
    Numbered message;
    EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), 0);
    EXPECT_EQ(receive(&message, -1), 0);
    ended = true;
    nudge.join();
    sigaction(SIGUSR1, &before, nullptr);
}

TEST_F(PlatformMessages, DescriptorIsReadableExactlyWhileMessagesWait)
{
    EXPECT_EQ(bt_host_receive_fd(), -1);
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    const int fd = bt_host_receive_fd();
    ASSERT_GE(fd, 0);
    EXPECT_EQ(bt_host_receive_fd(), fd);

    pollfd readable{fd, POLLIN, 0};
    Numbered message;
    for (int round = 0; round < 200; ++round) {
        ASSERT_EQ(poll(&readable, 1, 0), 0) << "round " << round;
        ASSERT_EQ(post(message), 0);
        ASSERT_EQ(post(message), 0);
        ASSERT_EQ(poll(&readable, 1, kLongMs), 1);
        ASSERT_EQ(receive(&message, 0), 1);
        ASSERT_EQ(poll(&readable, 1, kLongMs), 1) << "one message waits still";
        ASSERT_EQ(receive(&message, 0), 1);
    }

    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), 0); }));
    ASSERT_EQ(poll(&readable, 1, kLongMs), 1) << "the end of the domain shows, too";
    EXPECT_EQ(receive(&message, 0), -1);
}

TEST_F(PlatformMessages, NumberHasOneLivingOwner)
{
    Line line;
    Child owner([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        EXPECT_EQ(bt_host_claim_pno(kPno), 0) << "the own number again";
        EXPECT_EQ(bt_host_claim_pno(kPno + 1), -1) << "a second number";
        std::thread([] { EXPECT_EQ(_sys_GetPno(), kPno); }).join(); // the owner is the process, not the thread
        line.say_to_parent();
        line.hear_parent();
        EXPECT_EQ(bt_host_release_pno(), 0);
        line.say_to_parent();
        line.hear_parent();
    });
    line.hear_child();
    EXPECT_EQ(bt_host_claim_pno(kPno), 1);
    EXPECT_NE(std::string(bt_host_error()).find(std::to_string(owner.pid)), std::string::npos) << bt_host_error();
    EXPECT_EQ(_sys_GetPno(), 0U);

    line.say_to_child();
    line.hear_child();
    EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
    EXPECT_EQ(post(Numbered(7)), 0);
    line.say_to_child();
    EXPECT_TRUE(owner.succeeded());

    Numbered message;
    EXPECT_EQ(receive(&message, 0), 1) << "the end of the former owner takes nothing away";
}

TEST_F(PlatformMessages, ReleaseEndsWaitingReceives)
{
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    std::atomic<bool> waits{false};
    std::thread receiver([&waits] {
        Numbered message;
        EXPECT_EQ(receive(&message, kLongMs), 1);
        waits = true;
        EXPECT_EQ(receive(&message, kLongMs), -1);
    });
    ASSERT_EQ(post(Numbered()), 0);
    while (!waits)
        sched_yield();
    EXPECT_EQ(bt_host_release_pno(), 0);
    receiver.join();
    EXPECT_EQ(bt_host_claim_pno(kPno), 0);
}

TEST_F(PlatformMessages, ChildOfAnOwnerOwnsNothing)
{
    setenv("BT_PLATFORM_PNO", "0x8C1", 1);
    ASSERT_EQ(_sys_GetPno(), kPno);
    ASSERT_GE(bt_host_receive_fd(), 0);
    ASSERT_EQ(_sys_ReqTimerStart(kPno, 5, 2, 0), 0);
    Numbered message;
    ASSERT_EQ(receive(&message, kLongMs), 1);

    EXPECT_TRUE(in_child([] {
        Numbered taken;
        EXPECT_EQ(_sys_GetPno(), 0U);
        EXPECT_EQ(_sys_RcvMsg(kPno, sizeof taken, &taken, 0), -1);
        EXPECT_EQ(receive(&taken, 0), -1);
        EXPECT_EQ(bt_host_receive_fd(), -1);
        EXPECT_NE(_sys_ReqTimerStart(kPno, 6, 2, 0), 0);
        EXPECT_EQ(bt_host_claim_pno(kPno), 1);
        EXPECT_EQ(post(Numbered(9)), 0) << "it can post as before";
        EXPECT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
        EXPECT_NE(_sys_GetPno(), kPno);
    }));
    EXPECT_EQ(_sys_GetPno(), kPno);
    EXPECT_EQ(receive(&message, 0), 1);
    EXPECT_EQ(bt_host_claim_pno(kPno), 0) << "the child's end left the lock alone";
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_claim_pno(kPno), 1); }));
}

TEST_F(PlatformMessages, EnvironmentGivesANumberOnce)
{
    const struct {
        const char* text;
        uint32_t number;
    } rows[] = {{"0x4001", 0x4001}, {"2241", 2241}, {"", 0}, {"0", 0}, {"12x", 0}, {"99999999999999999999", 0}};
    for (const auto& row : rows) {
        setenv("BT_PLATFORM_PNO", row.text, 1);
        EXPECT_TRUE(in_child([&row] {
            EXPECT_EQ(_sys_GetPno(), row.number);
            bt_host_release_pno();
            EXPECT_EQ(_sys_GetPno(), 0U) << "a number given back does not return";
        })) << row.text;
    }
}

TEST_F(PlatformMessages, AnyNumberIsAFreeOneWithAnEmptyQueue)
{
    Line line;
    uint32_t first = 0;
    {
        Child killed([&] {
            ASSERT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
            ASSERT_EQ(_sys_GetPno(), static_cast<uint32_t>(BT_HOST_FIRST_FREE_PNO));
            ASSERT_EQ(post(Numbered(1), _sys_GetPno()), 0);
            line.say_to_parent();
            line.hear_parent();
        });
        line.hear_child();
        ASSERT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
        first = _sys_GetPno();
        EXPECT_EQ(first, static_cast<uint32_t>(BT_HOST_FIRST_FREE_PNO) + 1);
    }
    EXPECT_TRUE(in_child([&] {
        ASSERT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
        EXPECT_EQ(_sys_GetPno(), static_cast<uint32_t>(BT_HOST_FIRST_FREE_PNO));
        Numbered message;
        EXPECT_EQ(receive(&message, 0), 0) << "messages to the one that died are not for its successor";
    }));
}

TEST_F(PlatformWithoutDomain, DomainsDoNotSeeEachOther)
{
    Line line;
    Child here([&] {
        ASSERT_EQ(bt_host_create_domain(), 0);
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        ASSERT_EQ(bt_host_create_data("D", 8), 0);
        ASSERT_EQ(_sys_SemLock(_sys_CreateSemaphore("L")), 0);
        line.say_to_parent();
        line.hear_parent();
        Numbered message;
        EXPECT_EQ(receive(&message, 0), 0);
    });
    line.hear_child();
    EXPECT_TRUE(in_child([] {
        setenv("BT_PLATFORM_DOMAIN", new_domain_name().c_str(), 1);
        ASSERT_EQ(bt_host_create_domain(), 0);
        void* address = nullptr;
        EXPECT_EQ(post(Numbered()), 1);
        EXPECT_EQ(_sys_LinkShareData("D", &address, nullptr), 1);
        EXPECT_EQ(_sys_SemLock(_sys_CreateSemaphore("L")), 0);
        EXPECT_EQ(bt_host_claim_pno(kPno), 0);
        EXPECT_EQ(bt_host_release_pno(), 0);
        EXPECT_EQ(bt_host_remove_domain(), 0);
    }));
    line.say_to_child();
    EXPECT_TRUE(here.succeeded());
}

TEST_F(PlatformMessages, RemovedDomainEndsReceiversAndCanBeCreatedAnew)
{
    Line line;
    Child receiver([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        line.say_to_parent();
        Numbered message;
        EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), -1);
        EXPECT_EQ(post(message), -1);
        line.say_to_parent();
        line.hear_parent();
        EXPECT_EQ(post(message), 1) << "the new domain is found without a restart";
        EXPECT_EQ(bt_host_claim_pno(kPno), 0);
    });
    line.hear_child();
    ASSERT_EQ(post(Numbered(), kPno + 1), 1);
    EXPECT_EQ(bt_host_remove_domain(), 0);
    line.hear_child();
    EXPECT_EQ(bt_host_create_domain(), 0);
    line.say_to_child();
    EXPECT_TRUE(receiver.succeeded());
    EXPECT_EQ(post(Numbered()), 0) << "the number of an owner that ended without a release";
}

} // namespace
} // namespace platform_test
