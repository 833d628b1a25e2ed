// Timers that expire into the process's own queue.
#include "platform_fixture.h"

#include <thread>

namespace platform_test {
namespace {

class PlatformTimers : public Domain {
protected:
    PlatformTimers() { EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error(); }

    static int32_t start(uint32_t id, uint32_t ms) { return _sys_ReqTimerStart(kPno, id, 2, ms); }
    static int32_t stop(uint32_t id) { return _sys_TimerStop(kPno, id, 2); }

    // Timer id of the next expiry.
    static uint32_t next_expiry()
    {
        Numbered message;
        EXPECT_EQ(receive(&message, kLongMs), 1);
        EXPECT_EQ(message.header.src_pno, kPno);
        EXPECT_EQ(message.header.len, 4);
        EXPECT_EQ(message.header.cid, static_cast<uint16_t>(message.words[0]));
        return message.words[0];
    }
};

TEST_F(PlatformTimers, ExpireInTheOrderOfTheirTimes)
{
    ASSERT_EQ(start(0x12345678, 60), 0);
    ASSERT_EQ(start(2, 30), 0);
    ASSERT_EQ(start(3, 0), 0);
    ASSERT_EQ(start(4, 30), 0);
    EXPECT_EQ(next_expiry(), 3U);
    EXPECT_EQ(next_expiry(), 2U);
    EXPECT_EQ(next_expiry(), 4U);
    EXPECT_EQ(next_expiry(), 0x12345678U);
    EXPECT_NE(stop(2), 0) << "expired";
}

TEST_F(PlatformTimers, StoppedOnesAndTheOldTimeOfRestartedOnesDoNotExpire)
{
    ASSERT_EQ(start(1, 40), 0);
    ASSERT_EQ(start(2, 20), 0);
    ASSERT_EQ(start(3, 10), 0);
    EXPECT_EQ(stop(2), 0);
    EXPECT_NE(stop(2), 0);
    ASSERT_EQ(start(3, 60), 0);
    EXPECT_EQ(next_expiry(), 1U);
    EXPECT_EQ(next_expiry(), 3U);
    Numbered message;
    EXPECT_EQ(receive(&message, 0), 0);
}

TEST_F(PlatformTimers, ArmedLongAgoDoNotHoldUpShortOnes)
{
    ASSERT_EQ(start(1, UINT32_MAX), 0);
    ASSERT_EQ(start(2, 1), 0);
    EXPECT_EQ(next_expiry(), 2U);
    EXPECT_EQ(stop(1), 0);
}

TEST_F(PlatformTimers, TheirNumberIsBounded)
{
    for (uint32_t id = 0; id < BT_HOST_TIMER_MAX; ++id)
        ASSERT_EQ(start(id, 1000000), 0);
    EXPECT_NE(start(BT_HOST_TIMER_MAX, 1000000), 0);
    EXPECT_EQ(start(5, 1000000), 0) << "a restart needs no place";
    EXPECT_EQ(stop(0), 0);
    EXPECT_EQ(start(BT_HOST_TIMER_MAX, 0), 0);
    EXPECT_EQ(next_expiry(), static_cast<uint32_t>(BT_HOST_TIMER_MAX));
}

TEST_F(PlatformTimers, FullQueueDelaysAnExpiry)
{
    uint32_t posted = 0;
    while (post(Numbered(77)) == 0)
        ++posted;
    BtHostQueue queue{};
    ASSERT_EQ(bt_host_list_queues(&queue, 1), 1);
    ASSERT_EQ(start(9, 0), 0);
    const uint64_t before = queue.refused;
    while (queue.refused < before + 3) // until it has been tried a few times
        ASSERT_EQ(bt_host_list_queues(&queue, 1), 1);
    Numbered message;
    for (uint32_t count = 0; count < posted; ++count)
        ASSERT_EQ(receive(&message, 0), 1);
    EXPECT_EQ(next_expiry(), 9U);
}

TEST_F(PlatformTimers, OnlyForTheOwnNumberAndOnlyWhileItIsOwned)
{
    EXPECT_NE(_sys_ReqTimerStart(kPno + 1, 1, 2, 0), 0);
    EXPECT_NE(_sys_ReqTimerStart(0, 1, 2, 0), 0);
    EXPECT_NE(_sys_TimerStop(kPno + 1, 1, 2), 0);

    ASSERT_EQ(start(1, 20), 0);
    ASSERT_EQ(bt_host_release_pno(), 0);
    EXPECT_NE(start(2, 0), 0);
    ASSERT_EQ(bt_host_claim_pno(kPno), 0);
    ASSERT_EQ(start(3, 40), 0);
    EXPECT_EQ(next_expiry(), 3U) << "the release stopped the first";
}

TEST_F(PlatformTimers, ThreadsShareThem)
{
    const auto churn = [](uint32_t first) {
        for (uint32_t round = 0; round < 500; ++round) {
            for (uint32_t id = first; id < first + 8; ++id)
                EXPECT_EQ(start(id, 1000000), 0);
            for (uint32_t id = first; id < first + 8; ++id)
                EXPECT_EQ(stop(id), 0);
        }
    };
    std::thread other(churn, 100);
    churn(200);
    other.join();
    ASSERT_EQ(start(1, 0), 0);
    EXPECT_EQ(next_expiry(), 1U);
}

} // namespace
} // namespace platform_test
