// The listener table and event dispatch.
#include "log_capture.h"

#include <bt_service/bt_events.h>
#include <bt_service/bt_message.h>

#include <algorithm>
#include <cstring>
#include <numeric>

namespace {

using fake::Bytes;

const char* const kTable = "/tmp/shm_eds_regist_table";

// Shuffled or not, suites of such a name run before all others: what a process creates once must not be there yet.
TEST(EventsDeathTest, SemaphoreIsCreatedOnFirstUseOrRefused)
{
    EXPECT_TRUE(fake::in_child([] {
        fake::reset();
        fake::area(kTable, 8004);
        const BtMessage message{};
        const uint32_t id = 1;
        fake::fail_only("CreateSemaphore");
        EXPECT_EQ(logged("EDS", BT_EDS_initialize),
                  (Lines{"[START] BT_EDS_initialize", " BT_EDS_initialize _sys_CreateSemaphore ERROR"}));
        EXPECT_EQ(BT_SRV_EvtSrv_regist(1, 1, 1, &id), 0u);
        fake::fail_only("");
        BT_EDS_dispatch(0, &message); // dispatch never creates the lock
        EXPECT_TRUE(fake::posts().empty());
        EXPECT_EQ(fake::lock_handle("BT_SRV_EDS_SEM_NAME"), 0u);
        BT_SRV_EvtSrv_suspend(5); // the listener side does
        EXPECT_NE(fake::lock_handle("BT_SRV_EDS_SEM_NAME"), 0u);
        BT_EDS_initialize();
        BT_EDS_initialize();
        EXPECT_EQ(fake::held_locks(), 0u);
        EXPECT_EQ(std::count(fake::calls().begin(), fake::calls().end(), "CreateSemaphore(BT_SRV_EDS_SEM_NAME)"), 4)
            << "two refused, then one for each side";
    }));
}

// The table's bytes, addressed by offset.
class Events : public testing::Test {
protected:
    Events()
    {
        fake::reset();
        table_ = fake::area(kTable, 8004, 0xCC);
        BT_EDS_initialize();
    }
    Bytes bytes(size_t at = 0, size_t size = 8004) const { return Bytes(table_ + at, table_ + at + size); }
    static uint32_t add(uint32_t count = 1, const uint32_t* ids = &kId)
    {
        return BT_SRV_EvtSrv_regist(0x12345678, 0xCAFE, count, ids);
    }
    static constexpr uint32_t kId = 0xA881;
    uint8_t* table_;
};

TEST_F(Events, RegistrationFillsTheFirstFreeEntry)
{
    const Bytes empty = fake::hex("01 00*8003");
    EXPECT_EQ(bytes(), empty);
    std::vector<uint32_t> ids(40);
    std::iota(ids.begin(), ids.end(), 0xA881u);
    EXPECT_EQ(add(40, ids.data()), 1u);
    EXPECT_EQ(BT_SRV_EvtSrv_regist(0x4002, 7, 0, ids.data()), 2u);
    EXPECT_EQ(bytes(0, 24), fake::hex("03000000 01000000 7856 0000 FECA0000 01000000 23000000"));
    EXPECT_EQ(std::memcmp(table_ + 24, ids.data(), 35 * 4), 0);
    EXPECT_EQ(bytes(164, 24), fake::hex("02000000 0240 0000 07000000 01000000 00000000 00000000"));

    BT_SRV_EvtSrv_deregist(1);
    EXPECT_EQ(bytes(4, 160), Bytes(160, 0));
    EXPECT_EQ(add(), 3u);
    EXPECT_EQ(bytes(4, 4), fake::hex("03 00 00 00"));
    BT_EDS_initialize();
    EXPECT_EQ(bytes(), empty);
}

TEST_F(Events, CountsAndNullsAtTheirLimits)
{
    const struct {
        uint32_t count, stored;
        bool accepted;
    } rows[] = {{0, 0, true}, {35, 35, true}, {36, 35, true}, {0x7FFFFFFF, 35, true}, {0x80000000u, 0, false}};
    for (const auto& row : rows) {
        // The caller's list may end right behind the ids that are taken.
        const void* const list = fake::guarded(4 * std::max(row.stored, 1u));
        const Bytes before = bytes();
        const uint32_t handle = add(row.count, static_cast<const uint32_t*>(list));
        EXPECT_EQ(handle != 0, row.accepted) << row.count;
        if (row.accepted) {
            EXPECT_EQ(table_[20], row.stored);
            BT_SRV_EvtSrv_deregist(handle);
        } else {
            EXPECT_EQ(bytes(), before);
        }
    }
    EXPECT_EQ(add(1, nullptr), 0u);
    fake::report_size(kTable, 8003);
    EXPECT_EQ(add(), 0u) << "too small a table";
    fake::report_size(kTable, 8004);
    std::memset(table_, 0, 4);
    EXPECT_EQ(add(), 0u) << "not initialised";
    EXPECT_EQ((fake::null_area(kTable), add()), 0u) << "linked, but nowhere";
}

TEST_F(Events, FiftyListenersFit)
{
    for (uint32_t i = 1; i <= 50; ++i)
        EXPECT_EQ(add(), i);
    const Bytes full = bytes();
    EXPECT_EQ(add(), 0u);
    EXPECT_EQ(bytes(), full);
    EXPECT_EQ(find_HdlList(50), static_cast<void*>(table_ + 4 + 160 * 49));
    EXPECT_EQ(find_HdlList(51), nullptr);
    EXPECT_EQ(find_HdlList(0), nullptr);
    BT_SRV_EvtSrv_deregist(20);
    EXPECT_EQ(find_HdlList(0), static_cast<void*>(table_ + 4 + 160 * 19));
}

TEST_F(Events, SuspendAndResumeTouchOnlyTheFlag)
{
    add();
    const uint32_t handle = add();
    Bytes expected = bytes();
    BT_SRV_EvtSrv_suspend(handle);
    expected[164 + 12] = 0;
    EXPECT_EQ(bytes(), expected);
    BT_SRV_EvtSrv_resume(handle);
    expected[164 + 12] = 1;
    EXPECT_EQ(bytes(), expected);
    for (void (*change)(uint32_t) : {BT_SRV_EvtSrv_suspend, BT_SRV_EvtSrv_resume, BT_SRV_EvtSrv_deregist})
        change(99);
    EXPECT_EQ(bytes(), expected) << "an unknown handle changes nothing";
    BT_SRV_EvtSrv_resume(0);
    EXPECT_EQ(bytes(324, 16), fake::hex("00*12 01 00*3")) << "the first free entry has handle 0";
    EXPECT_EQ(add(), 3u);
    EXPECT_EQ(bytes(324, 4), fake::hex("03 00 00 00"));
}

TEST_F(Events, EveryFailureLeavesTableAndLockAsTheyWere)
{
    const BtMessage message{};
    const uint32_t handle = add();
    const Bytes before = bytes();
    const struct {
        std::function<void()> call;
        uint32_t calls; // before the last one, which gives the lock back
    } rows[] = {{[] { EXPECT_EQ(add(), 0u); }, 2},
                {[=] { BT_SRV_EvtSrv_deregist(handle); }, 2},
                {[=] { BT_SRV_EvtSrv_suspend(handle); }, 2},
                {BT_EDS_initialize, 2},
                {[&] { BT_EDS_dispatch(0, &message); }, 1}};
    for (const auto& row : rows)
        for (void (*fail)(uint32_t) : {fake::fail_nth, fake::fail_from})
            for (uint32_t n = 1; n <= row.calls; ++n) {
                SCOPED_TRACE(std::to_string(&row - rows) + ", call " + std::to_string(n));
                const uint32_t stray = fake::stray_unlocks();
                fail(n);
                row.call();
                fail(0);
                EXPECT_EQ(bytes(), before);
                EXPECT_EQ(fake::held_locks(), 0u);
                EXPECT_EQ(fake::stray_unlocks() - stray, n == 1 ? 1u : 0u) << "a failed lock is unlocked once";
            }
    EXPECT_TRUE(fake::posts().empty());
    EXPECT_EQ(fake::deepest_lock(), 1u);
}

TEST_F(Events, DispatchPostsHeaderAndPayloadUnderTheLock)
{
    BtMessage message{};
    message.msg_header.hdr.cid = 0xA881;
    message.msg_header.hdr.len = 12;
    EXPECT_EQ(logged("EDS", [&] { BT_EDS_dispatch(123, &message); }),
              (Lines{"[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch"}));
    ASSERT_EQ(fake::posts().size(), 1u);
    EXPECT_EQ(fake::posts()[0].pno, 0xFF02u);
    EXPECT_EQ(fake::posts()[0].message.size(), 28u);
    EXPECT_EQ(Lines(fake::calls().end() - 3, fake::calls().end()), (Lines{"SemLock", "SndMsg", "SemUnlock"}));
    EXPECT_EQ(logged("CMN", [&] { BT_EDS_dispatch(123, &message); })[0],
              "[API][START] BT_CMN_sendMsgWrapper BT_EDS_dispatch\n");
}

TEST_F(Events, DispatchSideLogsEveryFailure)
{
    const BtMessage message{};
    const auto dispatch = [&] { BT_EDS_dispatch(0, &message); };
    EXPECT_EQ(logged("EDS", [] { BT_EDS_dispatch(0, nullptr); }),
              (Lines{"[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch Param ERROR"}));
    EXPECT_TRUE(fake::posts().empty());
    fake::answer_send(2);
    EXPECT_EQ(logged("EDS", dispatch),
              (Lines{"[START] BT_EDS_dispatch", "[BT_EDS_dispatch] Send Error= 1", "[END] BT_EDS_dispatch"}));
    fake::answer_send(0);
    const struct {
        const char* failing;
        Lines initialize, dispatch;
    } rows[] = {{"SemLock",
                 {"[START] BT_EDS_initialize", "[END] BT_EDS_initialize get sem ERROR"},
                 {"[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch get sem ERROR"}},
                {"SemUnlock",
                 {"[START] BT_EDS_initialize", " BT_EDS_initialize intialize shared memory",
                  " BT_EDS_initialize release sem ERROR", "[END] BT_EDS_initialize"},
                 {"[START] BT_EDS_dispatch", " BT_EDS_dispatch release sem ERROR", "[END] BT_EDS_dispatch"}},
                {"LinkShareData",
                 {"[START] BT_EDS_initialize", "[END] BT_EDS_initialize"},
                 {"[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch"}}};
    for (const auto& row : rows) {
        fake::fail_only(row.failing);
        EXPECT_EQ(logged("EDS", BT_EDS_initialize), row.initialize) << row.failing;
        EXPECT_EQ(logged("EDS", dispatch), row.dispatch) << row.failing;
    }
}

} // namespace
