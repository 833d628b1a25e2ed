// Posting and receiving between real processes.
#include "platform_fixture.h"

#include <poll.h>
#include <pthread.h>

#include <atomic>
#include <thread>

namespace bt::test {
namespace {

using PlatformMessages = OwnedNumber;
using PlatformNumbers = Domain;
using PlatformWithoutDomain = EmptyDomain;

TEST_F(PlatformMessages, EachFailureHasItsOwnResult)
{
    const Numbered message;
    const void* const some = &message;
    const std::tuple<uint32_t, uint32_t, const void*, int32_t> rows[] = {
        {kPno, 16, some, 0}, {kPno, 1024, some, 0},       {kPno, 15, some, 3},    {kPno, 1025, some, 3},
        {kPno, 0, some, 3},  {kPno, UINT32_MAX, some, 3}, {kPno, 16, nullptr, 3}, {kPno + 1, 16, some, 1},
        {0, 16, some, 1},    {UINT32_MAX, 16, some, 1},
    };
    for (const auto& [pno, size, bytes, result] : rows)
        EXPECT_EQ(_sys_SndMsg(pno, size, bytes, 0), result) << pno << " " << size;

    uint64_t posted = 2;
    while (post(message) == 0)
        ++posted;
    EXPECT_EQ(post(message), 2);
    EXPECT_TRUE(error_names("full")) << bt_host_error();
    const BtHostQueue queue = first_queue();
    EXPECT_EQ(queue.queued, queue.capacity);
    EXPECT_EQ(queue.posted, posted);
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
    EXPECT_EQ(post(message), -1);
    EXPECT_TRUE(error_names(name)) << bt_host_error();
    EXPECT_EQ(receive(&message, 0), -1);
    EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), -1);
    EXPECT_EQ(bt_host_claim_pno(kPno), -1);
    EXPECT_EQ(_sys_CreateSemaphore("L"), 0U);
    EXPECT_NE(_sys_LinkShareData("D", &address, nullptr), 0);
    EXPECT_EQ(address, nullptr);
    EXPECT_NE(_sys_ReqTimerStart(kPno, 1, 2, 1), 0);
    EXPECT_EQ(bt_host_remove_domain(), -1);

    for (const char* bad : {"a/b", "a.b", "012345678901234567890123456789012", "ü"}) {
        setenv("BT_PLATFORM_DOMAIN", bad, 1);
        EXPECT_EQ(bt_host_create_domain(), -1) << bad;
        EXPECT_TRUE(error_names("BT_PLATFORM_DOMAIN")) << bt_host_error();
    }
}

TEST_F(PlatformMessages, MessageArrivesWholeAndTheRestOfTheBufferIsZero)
{
    const Numbered sent(0xA5A5A5A5);
    for (const uint32_t size : {16U, 17U, 1023U, 1024U}) {
        ASSERT_EQ(_sys_SndMsg(kPno, size, &sent, 0), 0);
        uint8_t buffer[1024];
        std::memset(buffer, 0x77, sizeof buffer);
        ASSERT_EQ(_sys_RcvMsg(kPno, sizeof buffer, buffer, 0), 1);
        EXPECT_EQ(std::memcmp(buffer, &sent, size), 0) << size;
        EXPECT_EQ(std::count(buffer + size, std::end(buffer), 0), 1024 - size) << size;
    }

    ASSERT_EQ(post(sent), 0);
    uint8_t small[32];
    std::memset(small, 0x77, sizeof small);
    EXPECT_EQ(bt_host_receive(small, 15, 0), -1);
    EXPECT_EQ(bt_host_receive(nullptr, 1024, 0), -1);
    EXPECT_EQ(_sys_RcvMsg(kPno + 1, sizeof small, small, 0), -1);
    EXPECT_EQ(bt_host_receive(small, 20, 0), 1);
    EXPECT_EQ(small[19], 0xA5);
    EXPECT_EQ(small[20], 0x77);
}

TEST_F(PlatformMessages, SleepingReceiverIsWokenByEachMessage)
{
    Child echo([] {
        ASSERT_EQ(bt_host_claim_pno(kPno + 1), 0);
        say(line_to_parent);
        for (Numbered message; receive(&message) == 1;)
            ASSERT_EQ(post(message), 0);
    });
    hear(echo.line);
    Numbered message;
    for (uint32_t number = 0; number < 2000; ++number) {
        ASSERT_EQ(post(Numbered(number), kPno + 1), 0);
        ASSERT_EQ(receive(&message), 1);
        ASSERT_EQ(message.words[0], number);
    }
}

TEST_F(PlatformMessages, SignalEndsTheWait)
{
    struct sigaction action {};
    action.sa_handler = [](int) {};
    action.sa_flags = SA_RESTART;
    ASSERT_EQ(sigaction(SIGUSR1, &action, nullptr), 0);
    std::atomic<bool> ended{false};
    std::thread nudge([&ended, receiver = pthread_self()] {
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
}

TEST_F(PlatformMessages, DescriptorIsReadableExactlyWhileMessagesWait)
{
    pollfd readable{bt_host_receive_fd(), POLLIN, 0};
    ASSERT_GE(readable.fd, 0);
    EXPECT_EQ(bt_host_receive_fd(), readable.fd);

    Numbered message;
    for (int round = 0; round < 200; ++round) {
        ASSERT_EQ(poll(&readable, 1, 0), 0) << "round " << round;
        ASSERT_EQ(post(message) | post(message), 0);
        for (int waiting = 2; waiting > 0; --waiting) {
            ASSERT_EQ(poll(&readable, 1, kLongMs), 1);
            ASSERT_EQ(receive(&message, 0), 1);
        }
    }

    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), 0); }));
    ASSERT_EQ(poll(&readable, 1, kLongMs), 1) << "the end of the domain shows, too";
    EXPECT_EQ(receive(&message, 0), -1);
}

TEST_F(PlatformNumbers, NumberHasOneLivingOwner)
{
    Child owner([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno) | bt_host_claim_pno(kPno), 0);
        EXPECT_EQ(bt_host_claim_pno(kPno + 1), -1) << "a second number";
        std::thread receiver([] {
            EXPECT_EQ(_sys_GetPno(), kPno) << "the owner is the process, not the thread";
            say(line_to_parent);
            Numbered message;
            EXPECT_EQ(receive(&message), -1) << "the release ends it";
        });
        hear(line_to_parent);
        EXPECT_EQ(bt_host_release_pno(), 0);
        receiver.join();
        stand();
    });
    hear(owner.line);
    EXPECT_EQ(bt_host_claim_pno(kPno), 1);
    EXPECT_TRUE(error_names(std::to_string(owner.pid))) << bt_host_error();
    EXPECT_EQ(_sys_GetPno(), 0U);

    say(owner.line);
    hear(owner.line);
    EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
    EXPECT_EQ(post(Numbered(7)), 0);
    say(owner.line);
    EXPECT_EQ(owner.end(), 0);
    Numbered message;
    EXPECT_EQ(receive(&message, 0), 1) << "the end of the former owner takes nothing away";
}

TEST_F(PlatformNumbers, ChildOfAnOwnerOwnsNothing)
{
    setenv("BT_PLATFORM_PNO", "0x8C1", 1);
    ASSERT_EQ(_sys_GetPno(), kPno);
    ASSERT_GE(bt_host_receive_fd(), 0);
    ASSERT_EQ(_sys_ReqTimerStart(kPno, 5, 2, 0), 0);
    Numbered message;
    ASSERT_EQ(receive(&message), 1);

    EXPECT_TRUE(in_child([&] {
        EXPECT_EQ(_sys_GetPno(), 0U);
        EXPECT_EQ(receive(&message, 0), -1);
        EXPECT_EQ(bt_host_receive_fd(), -1);
        EXPECT_NE(_sys_ReqTimerStart(kPno, 6, 2, 0), 0);
        EXPECT_EQ(bt_host_claim_pno(kPno), 1);
        EXPECT_EQ(post(Numbered(9)), 0) << "it can post as before";
        EXPECT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
        EXPECT_NE(_sys_GetPno(), kPno);
    }));
    EXPECT_EQ(receive(&message, 0), 1);
    EXPECT_EQ(bt_host_claim_pno(kPno), 0);
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_claim_pno(kPno), 1); })) << "the child's end took the number away";
}

TEST_F(PlatformNumbers, EnvironmentGivesANumberOnce)
{
    const std::pair<const char*, uint32_t> rows[] = {{"0x4001", 0x4001}, {"2241", 2241}, {"", 0},
                                                     {"0", 0},           {"12x", 0},     {"99999999999999999999", 0}};
    for (const auto& [text, number] : rows) {
        setenv("BT_PLATFORM_PNO", text, 1);
        EXPECT_TRUE(in_child([number = number] {
            EXPECT_EQ(_sys_GetPno(), number);
            bt_host_release_pno();
            EXPECT_EQ(_sys_GetPno(), 0U) << "a number given back does not return";
        })) << text;
    }
}

TEST_F(PlatformNumbers, AnyNumberIsAFreeOneWithAnEmptyQueue)
{
    const auto claim = [](uint32_t expected) {
        ASSERT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0);
        EXPECT_EQ(_sys_GetPno(), expected);
    };
    Child first([&] {
        claim(0x4000);
        ASSERT_EQ(post(Numbered(), _sys_GetPno()), 0);
        stand();
    });
    hear(first.line);
    claim(0x4001);
    EXPECT_EQ(first.end(SIGKILL), -SIGKILL);
    EXPECT_TRUE(in_child([&] {
        claim(0x4000);
        Numbered message;
        EXPECT_EQ(receive(&message, 0), 0) << "messages to the one that died are not for its successor";
    }));
}

TEST_F(PlatformNumbers, RemovedDomainEndsReceiversAndCanBeCreatedAnew)
{
    Child receiver([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        const uint32_t lock = _sys_CreateSemaphore("L");
        say(line_to_parent);
        Numbered message;
        EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), -1);
        EXPECT_EQ(post(message), -1);
        EXPECT_NE(_sys_SemLock(lock), 0);
        stand();
        EXPECT_EQ(post(message), 1) << "the new domain is found without a restart";
        EXPECT_EQ(bt_host_claim_pno(kPno), 0);
        EXPECT_EQ(_sys_SemLock(lock), 0) << bt_host_error();
        EXPECT_EQ(first_lock().holder_pid, static_cast<uint32_t>(getpid()));
    });
    hear(receiver.line);
    EXPECT_EQ(bt_host_remove_domain(), 0);
    hear(receiver.line);
    EXPECT_EQ(bt_host_create_domain(), 0);
    say(receiver.line);
    EXPECT_EQ(receiver.end(), 0);
    EXPECT_EQ(post(Numbered()), 0) << "the number of an owner that ended without a release";
}

} // namespace
} // namespace bt::test
