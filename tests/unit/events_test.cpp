// The listener table and event dispatch.
#include "fake_platform.h"
#include "log_capture.h"

#include <bt_service/bt_events.h>
#include <bt_service/bt_message.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <numeric>

namespace {

using testing::ElementsAre;

const char* const kTable = "/tmp/shm_eds_regist_table";
const char* const kLock = "BT_SRV_EDS_SEM_NAME";

// The first test of this file: handles that a process creates once must not be there yet.
TEST(EventsBeforeFirstUse, SemaphoreIsCreatedOnFirstUseOrRefused)
{
    fake::reset();
    fake::area(kTable, 8004);
    ASSERT_TRUE(fake::in_child([] {
        LogCapture log;
        BtMessage message{};
        fake::fail_only("CreateSemaphore");
        BT_EDS_initialize();
        EXPECT_THAT(LogCapture::texts(),
                    ElementsAre("EDS|[START] BT_EDS_initialize", "EDS| BT_EDS_initialize _sys_CreateSemaphore ERROR"));
        const uint32_t id = 1;
        EXPECT_EQ(BT_SRV_EvtSrv_regist(1, 1, 1, &id), 0u);
        fake::fail_only("");
        BT_EDS_dispatch(0, &message); // dispatch never creates the lock
        EXPECT_TRUE(fake::posts().empty());
        EXPECT_EQ(fake::lock_handle(kLock), 0u);
        BT_SRV_EvtSrv_suspend(5); // the listener side does
        EXPECT_NE(fake::lock_handle(kLock), 0u);
        EXPECT_EQ(fake::held_locks(), 0u);
        BT_EDS_initialize();
        BT_EDS_initialize();
        const auto& calls = fake::calls();
        EXPECT_EQ(std::count(calls.begin(), calls.end(), "CreateSemaphore(BT_SRV_EDS_SEM_NAME)"), 4)
            << "two refused, then one for each side";
    }));
}

// The table's bytes, addressed by offset.
class Events : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        table_ = fake::area(kTable, 8004, 0xCC);
        BT_EDS_initialize();
    }
    uint32_t word(size_t offset) const
    {
        uint32_t value;
        std::memcpy(&value, table_ + offset, sizeof value);
        return value;
    }
    void set(size_t offset, uint32_t value) { std::memcpy(table_ + offset, &value, sizeof value); }
    static size_t entry(uint32_t index) { return 4 + 160 * index; }
    fake::Bytes snapshot() const { return fake::Bytes(table_, table_ + 8004); }
    static uint32_t add(uint32_t pno = 0x4001)
    {
        const uint32_t ids[] = {0xA881};
        return BT_SRV_EvtSrv_regist(pno, 0, 1, ids);
    }
    uint8_t* table_ = nullptr;
};

TEST_F(Events, InitializeClearsTheTable)
{
    EXPECT_EQ(word(0), 1u);
    EXPECT_EQ(snapshot(), [] {
        fake::Bytes bytes(8004, 0);
        bytes[0] = 1;
        return bytes;
    }());
    add();
    BT_EDS_initialize();
    EXPECT_EQ(word(0), 1u);
    EXPECT_EQ(word(entry(0)), 0u);
    EXPECT_EQ(fake::held_locks(), 0u);
}

TEST_F(Events, RegistrationFillsTheFirstFreeEntry)
{
    std::vector<uint32_t> ids(40);
    std::iota(ids.begin(), ids.end(), 0xA881u);
    EXPECT_EQ(BT_SRV_EvtSrv_regist(0x12345678, 0xCAFE, 40, ids.data()), 1u);
    EXPECT_EQ(BT_SRV_EvtSrv_regist(0x4002, 7, 0, ids.data()), 2u);
    EXPECT_EQ(word(0), 3u);
    EXPECT_EQ(fake::Bytes(table_ + 4, table_ + 4 + 20), fake::hex("01000000 7856 0000 FECA0000 01000000 23000000"));
    EXPECT_EQ(std::memcmp(table_ + entry(0) + 20, ids.data(), 35 * 4), 0);
    EXPECT_EQ(fake::Bytes(table_ + entry(1), table_ + entry(1) + 24),
              fake::hex("02000000 0240 0000 07000000 01000000 00000000 00000000"));

    BT_SRV_EvtSrv_deregist(1);
    EXPECT_EQ(fake::Bytes(table_ + entry(0), table_ + entry(1)), fake::Bytes(160, 0));
    EXPECT_EQ(add(), 3u);
    EXPECT_EQ(word(entry(0)), 3u);
}

TEST_F(Events, CountsAndNullsAtTheirLimits)
{
    std::vector<uint32_t> ids(35, 9);
    const struct {
        uint32_t count;
        uint32_t stored;
        bool accepted;
    } rows[] = {{0, 0, true},   {1, 1, true},           {34, 34, true},          {35, 35, true},
                {36, 35, true}, {0x7FFFFFFF, 35, true}, {0x80000000u, 0, false}, {0xFFFFFFFFu, 0, false}};
    for (const auto& row : rows) {
        // The caller's list may end right behind the ids that are taken.
        uint8_t* const list = fake::guarded(4 * std::max(row.stored, 1u));
        const fake::Bytes before = snapshot();
        const uint32_t handle = BT_SRV_EvtSrv_regist(1, 2, row.count, reinterpret_cast<const uint32_t*>(list));
        EXPECT_EQ(handle != 0, row.accepted) << row.count;
        if (row.accepted) {
            EXPECT_EQ(word(entry(0) + 16), row.stored);
            BT_SRV_EvtSrv_deregist(handle);
        } else {
            EXPECT_EQ(snapshot(), before);
        }
    }
    EXPECT_EQ(BT_SRV_EvtSrv_regist(1, 2, 1, nullptr), 0u);
    set(0, 0);
    EXPECT_EQ(add(), 0u) << "not initialised";
}

TEST_F(Events, FiftyListenersFit)
{
    for (uint32_t i = 1; i <= 50; ++i)
        EXPECT_EQ(add(), i);
    const fake::Bytes full = snapshot();
    EXPECT_EQ(add(), 0u);
    EXPECT_EQ(snapshot(), full);
    EXPECT_EQ(find_HdlList(50), static_cast<void*>(table_ + entry(49)));
    EXPECT_EQ(find_HdlList(51), nullptr);
    EXPECT_EQ(find_HdlList(0), nullptr);
    BT_SRV_EvtSrv_deregist(20);
    EXPECT_EQ(find_HdlList(0), static_cast<void*>(table_ + entry(19)));
}

TEST_F(Events, SuspendAndResumeTouchOnlyTheFlag)
{
    add();
    const uint32_t handle = add(0x4002);
    fake::Bytes expected = snapshot();
    BT_SRV_EvtSrv_suspend(handle);
    expected[entry(1) + 12] = 0;
    EXPECT_EQ(snapshot(), expected);
    BT_SRV_EvtSrv_resume(handle);
    expected[entry(1) + 12] = 1;
    EXPECT_EQ(snapshot(), expected);
    for (void (*change)(uint32_t) : {BT_SRV_EvtSrv_suspend, BT_SRV_EvtSrv_resume, BT_SRV_EvtSrv_deregist}) {
        change(99);
        EXPECT_EQ(snapshot(), expected) << "an unknown handle changes nothing";
    }
    BT_SRV_EvtSrv_resume(0);
    EXPECT_EQ(word(entry(2)), 0u);
    EXPECT_EQ(word(entry(2) + 12), 1u);
    EXPECT_EQ(add(), 3u);
    EXPECT_EQ(word(entry(2)), 3u);
}

TEST_F(Events, EveryFailureLeavesTableAndLockAsTheyWere)
{
    const uint32_t handle = add();
    const fake::Bytes before = snapshot();
    struct Row {
        const char* name;
        std::function<bool()> call; // true when it reports success
    };
    const Row rows[] = {{"regist", [] { return add() != 0; }},
                        {"deregist",
                         [&] {
                             BT_SRV_EvtSrv_deregist(handle);
                             return false;
                         }},
                        {"suspend", [&] {
                             BT_SRV_EvtSrv_suspend(handle);
                             return false;
                         }}};
    for (const Row& row : rows) {
        for (const char* failing : {"SemLock", "LinkShareData"}) {
            for (const bool all_after : {false, true}) {
                fake::fail_nth(0);
                const uint32_t first = fake::counted_calls() + (std::strcmp(failing, "SemLock") == 0 ? 1 : 2);
                all_after ? fake::fail_from(first) : fake::fail_nth(first);
                EXPECT_FALSE(row.call()) << row.name << failing;
                EXPECT_EQ(snapshot(), before) << row.name << failing;
                fake::fail_from(0);
                fake::fail_nth(0);
                EXPECT_EQ(fake::held_locks(), 0u);
            }
        }
        fake::remove_area(kTable);
        EXPECT_FALSE(row.call());
        EXPECT_EQ(fake::held_locks(), 0u);
        table_ = fake::area(kTable, 8004);
        std::memcpy(table_, before.data(), before.size());
    }
    EXPECT_EQ(fake::deepest_lock(), 1u);
}

TEST_F(Events, FailedLockIsUnlockedOnce)
{
    fake::fail_only("SemLock");
    const uint32_t stray = fake::stray_unlocks();
    add();
    EXPECT_EQ(fake::stray_unlocks(), stray + 1);
    BT_SRV_EvtSrv_suspend(1);
    EXPECT_EQ(fake::stray_unlocks(), stray + 2);
    BT_EDS_initialize();
    EXPECT_EQ(fake::stray_unlocks(), stray + 3);
    BtMessage message{};
    BT_EDS_dispatch(0, &message);
    EXPECT_EQ(fake::stray_unlocks(), stray + 4);
    EXPECT_TRUE(fake::posts().empty());
}

TEST_F(Events, DispatchPostsHeaderAndPayloadUnderTheLock)
{
    BtMessage message{};
    message.msg_header.hdr.cid = 0xA881;
    message.msg_header.hdr.len = 12;
    LogCapture log;
    BT_EDS_dispatch(123, &message);
    ASSERT_EQ(fake::posts().size(), 1u);
    EXPECT_EQ(fake::posts()[0].pno, 0xFF02u);
    EXPECT_EQ(fake::posts()[0].message.size(), 28u);
    std::vector<std::string> eds;
    for (const std::string& text : LogCapture::texts())
        if (text.compare(0, 4, "EDS|") == 0) eds.push_back(text);
    EXPECT_THAT(eds, ElementsAre("EDS|[START] BT_EDS_dispatch", "EDS|[END] BT_EDS_dispatch"));
    const auto& calls = fake::calls();
    EXPECT_THAT(std::vector<std::string>(calls.end() - 3, calls.end()), ElementsAre("SemLock", "SndMsg", "SemUnlock"));
}

TEST_F(Events, DispatchSideLogsEveryFailure)
{
    BtMessage message{};
    LogCapture log;
    const auto eds = [] {
        std::vector<std::string> out;
        for (const std::string& text : LogCapture::texts())
            if (text.compare(0, 4, "EDS|") == 0) out.push_back(text.substr(4));
        return out;
    };
    BT_EDS_dispatch(0, nullptr);
    EXPECT_THAT(eds(), ElementsAre("[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch Param ERROR"));
    EXPECT_TRUE(fake::posts().empty());
    fake::answer_send(2);
    BT_EDS_dispatch(0, &message);
    EXPECT_THAT(eds(),
                ElementsAre("[START] BT_EDS_dispatch", "[BT_EDS_dispatch] Send Error= 1", "[END] BT_EDS_dispatch"));
    fake::answer_send(0);
    fake::fail_only("SemLock");
    BT_EDS_dispatch(0, &message);
    BT_EDS_initialize();
    EXPECT_THAT(eds(), ElementsAre("[START] BT_EDS_dispatch", "[END] BT_EDS_dispatch get sem ERROR",
                                   "[START] BT_EDS_initialize", "[END] BT_EDS_initialize get sem ERROR"));
    fake::fail_only("SemUnlock");
    BT_EDS_dispatch(0, &message);
    BT_EDS_initialize();
    EXPECT_THAT(eds(),
                ElementsAre("[START] BT_EDS_dispatch", " BT_EDS_dispatch release sem ERROR", "[END] BT_EDS_dispatch",
                            "[START] BT_EDS_initialize", " BT_EDS_initialize intialize shared memory",
                            " BT_EDS_initialize release sem ERROR", "[END] BT_EDS_initialize"));
    fake::fail_only("LinkShareData");
    BT_EDS_initialize();
    EXPECT_THAT(eds(), ElementsAre("[START] BT_EDS_initialize", "[END] BT_EDS_initialize"));
}

} // namespace
