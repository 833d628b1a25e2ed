// Timers that expire into the process's own queue.
#include "platform_fixture.h"

#include <thread>

namespace bt::test {
namespace {

class PlatformTimers : public OwnedNumber {
protected:
    static int32_t start(uint32_t id, uint32_t ms) { return _sys_ReqTimerStart(kPno, id, 2, ms); }
    static int32_t stop(uint32_t id) { return _sys_TimerStop(kPno, id, 2); }

    static void expect_expiries(std::initializer_list<uint32_t> ids)
    {
        for (const uint32_t id : ids) {
            Numbered message;
            ASSERT_EQ(receive(&message), 1);
            EXPECT_EQ(message.words[0], id);
            EXPECT_EQ(message.header.src_pno, kPno);
            EXPECT_EQ(message.header.len, 4);
            EXPECT_EQ(message.header.cid, static_cast<uint16_t>(id));
        }
    }
};

TEST_F(PlatformTimers, ExpireInTheOrderOfTheirLatestTimesUnlessStopped)
{
    const std::pair<uint32_t, uint32_t> starts[] = {{1, UINT32_MAX}, {0x12345678, 600}, {2, 300}, {3, 0},
                                                    {4, 300},        {5, 1000000},      {6, 250}, {6, 700}};
    for (const auto& [id, ms] : starts)
        ASSERT_EQ(start(id, ms), 0);
    EXPECT_EQ(stop(5), 0);
    EXPECT_NE(stop(5), 0);
    expect_expiries({3, 2, 4, 0x12345678, 6});
    EXPECT_NE(stop(2), 0) << "expired";
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
    expect_expiries({BT_HOST_TIMER_MAX});
}

TEST_F(PlatformTimers, FullQueueDelaysAnExpiry)
{
    while (post(Numbered()) == 0) {
    }
    ASSERT_EQ(start(9, 0), 0);
    while (first_queue().refused < 4) // until it has been tried a few times
        sched_yield();
    Numbered message;
    for (uint32_t waiting = first_queue().queued; waiting > 0; --waiting)
        ASSERT_EQ(receive(&message, 0), 1);
    expect_expiries({9});
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
    expect_expiries({3}); // the release stopped the first
}

TEST_F(PlatformTimers, ThreadsShareThem)
{
    const auto churn = [](uint32_t first) {
        for (uint32_t call = 0; call < 8000; ++call) {
            const uint32_t id = first + call % 8;
            EXPECT_EQ(call / 8 % 2 == 0 ? start(id, 1000000) : stop(id), 0);
        }
    };
    std::thread other(churn, 100);
    churn(200);
    other.join();
    ASSERT_EQ(start(1, 0), 0);
    expect_expiries({1});
}

} // namespace
} // namespace bt::test
