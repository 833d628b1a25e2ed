// Processes killed at any moment: what survives is whole, and nobody waits for the dead.
#include "platform_fixture.h"

#include <sys/mman.h>

#include <atomic>

namespace platform_test {
namespace {

using PlatformKilled = Domain;

// Memory that the children of a test share with it, zero at first.
template <class T>
class Shared {
public:
    Shared() : memory_(mmap(nullptr, sizeof(T), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0))
    {
        if (memory_ == MAP_FAILED) std::abort();
    }
    ~Shared() { munmap(memory_, sizeof(T)); }
    Shared(const Shared&) = delete;
    Shared& operator=(const Shared&) = delete;
    T* operator->() { return static_cast<T*>(memory_); }
    T& operator*() { return *static_cast<T*>(memory_); }

private:
    void* const memory_;
};

TEST_F(PlatformKilled, SenderLeavesTheWayFree)
{
    constexpr uint16_t kMarker = 2;
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    for (uint32_t round = 0; round < 60; ++round) {
        Child flood([] {
            for (uint32_t number = 0;; ++number)
                post(Numbered(number, 1));
        });
        Numbered message;
        for (uint32_t count = 0; count < 20 + round * 7; ++count) {
            ASSERT_EQ(receive(&message, kLongMs), 1);
            ASSERT_TRUE(message.whole());
        }
        flood.kill_now();

        Child next([&] { ASSERT_EQ(post_patiently(Numbered(round, kMarker)), 0) << bt_host_error(); });
        do {
            ASSERT_EQ(receive(&message, kLongMs), 1) << "round " << round;
            ASSERT_TRUE(message.whole());
        } while (message.header.src_pno != kMarker);
        EXPECT_EQ(message.words[0], round);
        EXPECT_TRUE(next.succeeded());
    }
}

TEST_F(PlatformKilled, ReceiverLeavesTheQueueToItsSuccessor)
{
    constexpr uint32_t kMessages = 40000;
    constexpr uint32_t kKills = 20;
    struct Record {
        std::atomic<uint32_t> seen[kMessages];
        std::atomic<uint32_t> taken, torn, backwards;
        std::atomic<bool> all_posted;
    };
    Shared<Record> record;
    ASSERT_TRUE(in_child([] { ASSERT_EQ(bt_host_claim_pno(kPno), 0); }));

    Child sender([&] {
        for (uint32_t number = 0; number < kMessages; ++number)
            ASSERT_EQ(post_patiently(Numbered(number)), 0) << bt_host_error();
        record->all_posted = true;
    });
    const auto receive_all = [&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
        uint32_t next = 0;
        Numbered message;
        for (;;) {
            const bool last = record->all_posted;
            if (receive(&message, last ? 0 : 10) != 1) {
                if (last) break;
                continue;
            }
            if (!message.whole()) ++record->torn;
            if (message.words[0] < next) ++record->backwards;
            next = message.words[0];
            ++record->seen[next % kMessages];
            ++record->taken;
        }
    };
    for (uint32_t kill = 1; kill <= kKills; ++kill) {
        Child receiver(receive_all);
        while (record->taken < kill * (kMessages / (kKills + 1)))
            sched_yield();
        receiver.kill_now();
    }
    EXPECT_TRUE(in_child(receive_all));
    EXPECT_TRUE(sender.succeeded());

    uint32_t lost = 0;
    uint32_t twice = 0;
    for (const auto& seen : record->seen) {
        if (seen == 0) ++lost;
        if (seen > 1) ++twice;
    }
    EXPECT_EQ(record->torn, 0U);
    EXPECT_EQ(record->backwards, 0U);
    EXPECT_LE(lost, kKills) << "at most the message in hand is lost with its receiver";
    EXPECT_LE(twice, kKills);
}

TEST_F(PlatformKilled, LockOfADeadHolderIsHandedOnAndCounted)
{
    constexpr uint32_t kDeaths = 5;
    const uint32_t lock = _sys_CreateSemaphore("L");
    ASSERT_NE(lock, 0U);
    for (uint32_t death = 1; death <= kDeaths; ++death) {
        Line line;
        Child holder([&] {
            ASSERT_EQ(_sys_SemLock(lock), 0);
            line.say_to_parent();
            line.hear_parent();
        });
        line.hear_child();
        BtHostLock state{};
        ASSERT_EQ(bt_host_list_locks(&state, 1), 1);
        EXPECT_EQ(state.holder_pid, static_cast<uint32_t>(holder.pid));
        holder.kill_now();

        EXPECT_EQ(_sys_SemLock(lock), 0) << bt_host_error();
        EXPECT_EQ(_sys_SemUnlock(lock), 0);
        ASSERT_EQ(bt_host_list_locks(&state, 1), 1);
        EXPECT_STREQ(state.name, "L");
        EXPECT_EQ(state.recovered, death);
        EXPECT_EQ(state.holder_pid, 0U);
    }
}

TEST_F(PlatformKilled, WaiterGetsTheLockWhenItsHolderDies)
{
    const uint32_t lock = _sys_CreateSemaphore("L");
    Line line;
    Child holder([&] {
        ASSERT_EQ(_sys_SemLock(lock), 0);
        line.say_to_parent();
        line.hear_parent();
    });
    line.hear_child();
    Line waiting;
    Child waiter([&] {
        waiting.say_to_parent();
        EXPECT_EQ(_sys_SemLock(lock), 0) << bt_host_error();
    });
    waiting.hear_child();
    holder.kill_now();
    EXPECT_TRUE(waiter.succeeded());
}

TEST_F(PlatformKilled, CreatorsOfObjectsLeaveNothingHalfMade)
{
    Shared<std::atomic<uint32_t>> rounds;
    for (uint32_t kill = 1; kill <= 40; ++kill) {
        const uint32_t start = *rounds;
        Child creator([&] {
            for (;; ++*rounds) {
                bt_host_claim_pno(BT_HOST_ANY_PNO);
                bt_host_create_data("D", 4096);
                _sys_CreateSemaphore("L");
                bt_host_remove_data("D");
                bt_host_release_pno();
            }
        });
        while (*rounds < start + kill)
            sched_yield();
        creator.kill_now();

        EXPECT_GE(bt_host_create_data("D", 4096), 0) << bt_host_error();
        void* address = nullptr;
        uint32_t size = 4096;
        EXPECT_EQ(_sys_LinkShareData("D", &address, &size), 0) << bt_host_error();
        EXPECT_EQ(bt_host_remove_data("D"), 0) << bt_host_error();
        ASSERT_TRUE(in_child([] {
            ASSERT_EQ(bt_host_claim_pno(BT_HOST_ANY_PNO), 0) << bt_host_error();
            EXPECT_EQ(post(Numbered(1), _sys_GetPno()), 0) << bt_host_error();
        }));
    }
}

TEST_F(PlatformKilled, DomainCreatedAndRemovedByProcessesThatDieCanBeCreatedAgain)
{
    Shared<std::atomic<uint32_t>> rounds;
    ASSERT_EQ(bt_host_remove_domain(), 0);
    for (uint32_t kill = 1; kill <= 20; ++kill) {
        const uint32_t start = *rounds;
        const auto churn = [&] {
            for (;; ++*rounds) {
                bt_host_create_domain();
                bt_host_create_data("D", 64);
                bt_host_remove_domain();
            }
        };
        Child one(churn);
        Child two(churn);
        while (*rounds < start + kill)
            sched_yield();
        one.kill_now();
        two.kill_now();

        ASSERT_GE(bt_host_create_domain(), 0) << bt_host_error();
        EXPECT_GE(bt_host_create_data("D", 64), 0) << bt_host_error();
        EXPECT_EQ(bt_host_remove_domain(), 0) << bt_host_error();
    }
    EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error();
}

} // namespace
} // namespace platform_test
