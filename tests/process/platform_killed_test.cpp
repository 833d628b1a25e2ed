// Processes killed at any moment: what survives is whole, and nobody waits for the dead.
#include "platform_fixture.h"

#include <sys/mman.h>

#include <atomic>
#include <thread>

namespace bt::test {
namespace {

using PlatformKilled = Domain;

// Zeros that the children of a test share with it.
template <class T>
T& shared()
{
    void* const memory = mmap(nullptr, sizeof(T), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED) std::abort();
    return *static_cast<T*>(memory);
}

// Kills two processes that do nothing but `churn` after ever more rounds, and looks each time at what they left.
void kill_at_any_moment(uint32_t kills, void (*churn)(), void (*look)())
{
    auto& rounds = shared<std::atomic<uint32_t>>();
    for (uint32_t kill = 1; kill <= kills; ++kill) {
        const uint32_t enough = rounds + kill;
        const auto forever = [&rounds, churn] {
            for (;; ++rounds)
                churn();
        };
        Child one(forever);
        Child two(forever);
        while (rounds < enough)
            sched_yield();
        one.end(SIGKILL);
        two.end(SIGKILL);
        look();
    }
}

TEST_F(PlatformKilled, SenderLeavesTheWayFreeAndNothingTorn)
{
    const auto churn = [] {
        static uint32_t number = 0;
        post(Numbered(++number));
    };
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    kill_at_any_moment(60, churn, [] {
        Numbered message;
        while (receive(&message, 0) == 1)
            EXPECT_TRUE(message.whole());
        EXPECT_TRUE(in_child([] { EXPECT_EQ(post(Numbered(7)), 0) << bt_host_error(); }));
        EXPECT_EQ(receive(&message), 1);
        EXPECT_EQ(message.words[0], 7U);
    });
}

// Four senders, in two processes, that share a lock; their receiver is killed again and again.
TEST_F(PlatformKilled, ReceiverLeavesTheMessagesOfEachSenderInOrderToItsSuccessor)
{
    constexpr uint32_t kMessages = 10000;
    constexpr uint32_t kKills = 20;
    struct Record {
        std::atomic<uint32_t> seen[4][kMessages];
        std::atomic<uint32_t> taken, wrong, done;
        uint32_t locked; // by the lock
    };
    auto& record = shared<Record>();
    ASSERT_TRUE(in_child([] { ASSERT_EQ(bt_host_claim_pno(kPno), 0); }));
    const uint32_t lock = _sys_CreateSemaphore("L");

    const auto send = [&](uint16_t sender) {
        for (uint32_t number = 0; number < kMessages; ++number) {
            ASSERT_EQ(post_patiently(Numbered(number, sender)), 0) << bt_host_error();
            ASSERT_EQ(_sys_SemLock(lock), 0) << bt_host_error();
            ++record.locked;
            ASSERT_EQ(_sys_SemUnlock(lock), 0);
        }
        ++record.done;
    };
    const auto two_threads = [&send](uint16_t first) {
        std::thread other(send, static_cast<uint16_t>(first + 1));
        send(first);
        other.join();
    };
    const auto receive_all = [&record] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
        uint32_t next[4] = {};
        Numbered message;
        for (bool last = false; !last;) {
            last = record.done == 4;
            while (receive(&message, last ? 0 : 10) == 1) {
                uint32_t& least = next[message.header.src_pno % 4];
                if (!message.whole() || message.words[0] < least) ++record.wrong;
                least = message.words[0];
                ++record.seen[message.header.src_pno % 4][least % kMessages];
                ++record.taken;
            }
        }
    };
    Child one([&] { two_threads(0); });
    Child two([&] { two_threads(2); });
    for (uint32_t kill = 1; kill <= kKills; ++kill) {
        Child receiver(receive_all);
        while (record.taken < kill * (4 * kMessages / (kKills + 1)))
            sched_yield();
        receiver.end(SIGKILL);
    }
    EXPECT_TRUE(in_child(receive_all));
    EXPECT_EQ(one.end() | two.end(), 0);

    int64_t lost = 0;
    int64_t twice = 0;
    for (const auto& seen : record.seen) {
        lost += std::count(std::begin(seen), std::end(seen), 0);
        twice += std::count_if(std::begin(seen), std::end(seen), [](uint32_t times) { return times > 1; });
    }
    EXPECT_EQ(record.wrong, 0U) << "torn or out of order";
    EXPECT_LE(lost, kKills) << "at most the message in hand is lost with its receiver";
    EXPECT_LE(twice, kKills);
    EXPECT_EQ(record.locked, 4 * kMessages) << "one at a time has the lock";
}

TEST_F(PlatformKilled, LockOfADeadHolderIsHandedOnAndCounted)
{
    const uint32_t lock = _sys_CreateSemaphore("L");
    for (uint32_t death = 0; death < 5; ++death) {
        Child holder([&] {
            ASSERT_EQ(_sys_SemLock(lock), 0);
            stand();
        });
        hear(holder.line);
        EXPECT_EQ(first_lock().recovered, 2 * death);
        EXPECT_EQ(first_lock().holder_pid, static_cast<uint32_t>(holder.pid));
        Child waiter([&] {
            say(line_to_parent);
            EXPECT_EQ(_sys_SemLock(lock), 0) << bt_host_error(); // and ends with it
        });
        hear(waiter.line);
        holder.end(SIGKILL);
        EXPECT_EQ(waiter.end(), 0);
        EXPECT_EQ(first_lock().holder_pid, 0U);
        EXPECT_STREQ(first_lock().name, "L");
    }
}

TEST_F(PlatformKilled, CreatorsOfObjectsLeaveNothingHalfMade)
{
    const auto churn = [] {
        bt_host_claim_pno(BT_HOST_ANY_PNO);
        bt_host_create_data("D", 4096);
        _sys_CreateSemaphore("L");
        bt_host_remove_data("D");
        bt_host_release_pno();
    };
    kill_at_any_moment(40, churn, [] {
        EXPECT_GE(bt_host_create_data("D", 4096), 0) << bt_host_error();
        uint32_t size = 4096;
        link_data("D", &size);
        EXPECT_EQ(bt_host_remove_data("D"), 0) << bt_host_error();
        EXPECT_TRUE(in_child([] {
            EXPECT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0) << bt_host_error();
            EXPECT_EQ(post(Numbered(), _sys_GetPno()), 0) << bt_host_error();
        }));
    });
}

TEST_F(PlatformKilled, DomainCreatedAndRemovedByProcessesThatDieCanBeCreatedAgain)
{
    const auto churn = [] {
        bt_host_create_domain();
        bt_host_create_data("D", 64);
        bt_host_remove_domain();
    };
    ASSERT_EQ(bt_host_remove_domain(), 0);
    kill_at_any_moment(20, churn, [] {
        ASSERT_GE(bt_host_create_domain(), 0) << bt_host_error();
        EXPECT_GE(bt_host_create_data("D", 64), 0) << bt_host_error();
        EXPECT_EQ(bt_host_remove_domain(), 0) << bt_host_error();
    });
}

} // namespace
} // namespace bt::test
