// The hands-free status area: its queries, its lock, its initial values, and attaching to both.
#include "request_rows.h"

#include <bt_service/bt_hands_free.h>
#include <gmock/gmock.h>

namespace {

using fake::Bytes;
using testing::ElementsAre;
using testing::IsEmpty;

const char* const kArea = "BT_HFP_SHARE_DATA_NAME";
const std::string kLink = "LinkShareData(BT_HFP_SHARE_DATA_NAME)", kCreate = "CreateSemaphore(BT_HFP_SEMAPHORE_NAME)";

struct Query {
    const char* name;
    size_t offset;
    uint32_t size;
    std::function<int32_t(void*)> call;
};

template <class Output>
std::function<int32_t(void*)> query(int32_t (*function)(Output*))
{
    return [=](void* out) { return function(static_cast<Output*>(out)); };
}

std::function<int32_t(void*)> call_info(uint32_t index)
{
    return [=](void* out) { return BT_SRV_HFP_getCallInfo(index, static_cast<BtHfpCall*>(out)); };
}

const Query kQueries[] = {
    {"signal level", 0, 4, query(BT_SRV_HFP_getSignalLevel)},
    {"service area", 4, 4, query(BT_SRV_HFP_getServiceAreaStatus)},
    {"roaming", 8, 4, query(BT_SRV_HFP_getRoamingStatus)},
    {"audio link", 12, 4, query(BT_SRV_HFP_getAudioLinkStatus)},
    {"AG functions", 16, 36, query(BT_SRV_HFP_getAGSupportFunction)},
    {"in-band ring tone", 32, 4, query(BT_SRV_HFP_getSupportInbandRingTone)},
    {"three-way call", 52, 28, query(BT_SRV_HFP_getSupportThreewayCall)},
    {"call list", 80, 1004, query(BT_SRV_HFP_getCallList)},
    {"call 0", 84, 100, call_info(0)},
    {"call 5", 584, 100, call_info(5)},
    {"call 9", 984, 100, call_info(9)},
};

// Every test starts as a process that has attached nothing.
class HandsFreeStatus : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        g_bt_hfp_share = {};
    }
    void TearDown() override { g_bt_hfp_share = {}; }

    // An area of which no two neighbouring words are equal; it ends where its last byte does.
    static uint8_t* patterned_area()
    {
        uint8_t* const area = fake::area(kArea, 1084);
        for (size_t i = 0; i < 1084; ++i)
            area[i] = static_cast<uint8_t>(i * 7 + i / 256);
        return area;
    }

    static Bytes output_of(const Query& row, int32_t result)
    {
        SCOPED_TRACE(row.name);
        return requests::output_of(row.size, row.call, result);
    }
    static std::vector<std::string> calls_since(size_t before)
    {
        return {fake::calls().begin() + static_cast<std::ptrdiff_t>(before), fake::calls().end()};
    }
};

TEST_F(HandsFreeStatus, HandleGrowsStepByStepAndStays)
{
    EXPECT_TRUE(fake::in_child([] {
        EXPECT_EQ(bt_hfp_getShareMemAccessPtr(), &g_bt_hfp_share);
        EXPECT_EQ(g_bt_hfp_share.area, nullptr);
        EXPECT_EQ(g_bt_hfp_share.semaphore, 0u);

        fake::fail_only("CreateSemaphore");
        EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1); // nothing there
        uint8_t* const area = patterned_area();
        EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1); // no lock yet
        EXPECT_EQ(g_bt_hfp_share.area, area);
        EXPECT_EQ(g_bt_hfp_share.semaphore, 0u);
        fake::fail_only("");
        EXPECT_EQ(bt_hfp_ShareMemAccessInit(), 0);
        EXPECT_EQ(g_bt_hfp_share.semaphore, fake::lock_handle("BT_HFP_SEMAPHORE_NAME"));
        EXPECT_EQ(bt_hfp_ShareMemAccessInit(), 0);
        EXPECT_THAT(fake::calls(), ElementsAre(kLink, kCreate, kLink, kCreate, kCreate));
        EXPECT_THAT(fake::sizes_asked(), ElementsAre(0u, 0u));
        EXPECT_EQ(g_bt_hfp_share.area, area);
    }));
    fake::fail_only("LinkShareData");
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1);
    EXPECT_EQ(g_bt_hfp_share.area, nullptr);
    EXPECT_NE(g_bt_hfp_share.semaphore, 0u) << "a failed link does not stop the lock";
}

TEST_F(HandsFreeStatus, QueriesCopyTheirFieldOnceAreaAndLockAreThere)
{
    const std::string lock = "SemLock", unlock = "SemUnlock";
    const struct {
        const char* failing;
        bool copied;
        std::vector<std::string> calls, calls_after; // and of a second query, when nothing fails any more
    } rows[] = {{"", true, {kLink, kCreate, lock, unlock}, {lock, unlock}},
                {"SemLock", true, {kLink, kCreate, lock, unlock}, {lock, unlock}},
                {"SemUnlock", true, {kLink, kCreate, lock, unlock}, {lock, unlock}},
                {"LinkShareData", false, {kLink, kCreate}, {kLink, lock, unlock}},
                {"CreateSemaphore", false, {kLink, kCreate}, {kCreate, lock, unlock}}};
    for (const Query& query : kQueries)
        for (const auto& row : rows) {
            SCOPED_TRACE(std::string(query.name) + " " + row.failing);
            fake::reset();
            g_bt_hfp_share = {};
            const uint8_t* const area = patterned_area();
            const Bytes field(area + query.offset, area + query.offset + query.size);
            fake::fail_only(row.failing);
            EXPECT_EQ(output_of(query, row.copied ? 0 : -1), row.copied ? field : Bytes());
            EXPECT_EQ(fake::calls(), row.calls);
            fake::fail_only("");
            EXPECT_EQ(output_of(query, 0), field);
            EXPECT_EQ(calls_since(row.calls.size()), row.calls_after);
            EXPECT_EQ(fake::held_locks(), 0u);
            EXPECT_EQ(fake::deepest_lock(), 1u);
            EXPECT_EQ(fake::stray_unlocks(), row.failing == lock ? 1u : 0u) << "the closing unlock alone";
            EXPECT_THAT(fake::logs(), IsEmpty());
        }
}

TEST_F(HandsFreeStatus, NullOutputsAndCallsThatAreNoneTouchNothing)
{
    patterned_area();
    for (const Query& row : kQueries)
        EXPECT_EQ(row.call(nullptr), -1) << row.name;
    // 42949673 * 100 is 4 in 32 bits
    for (const uint32_t index : {10u, 11u, 256u, 0x1000009u, 42949673u, 0x7FFFFFFFu, 0x80000000u, UINT32_MAX}) {
        EXPECT_EQ(output_of({"call", 0, 100, call_info(index)}, -1), Bytes()) << index;
        EXPECT_EQ(call_info(index)(nullptr), -1) << index;
    }
    EXPECT_THAT(fake::calls(), IsEmpty());
    EXPECT_EQ(g_bt_hfp_share.area, nullptr);
    EXPECT_EQ(g_bt_hfp_share.semaphore, 0u);
}

TEST_F(HandsFreeStatus, LockAndUnlockNeedBothAreaAndLock)
{
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    uint8_t* const area = patterned_area();
    ASSERT_EQ(bt_hfp_ShareMemAccessInit(), 0);
    const uint32_t lock = g_bt_hfp_share.semaphore;
    const std::pair<void*, uint32_t> halves[] = {{nullptr, lock}, {area, 0}};
    for (const auto& [there, handle] : halves) {
        g_bt_hfp_share.area = there;
        g_bt_hfp_share.semaphore = handle;
        EXPECT_EQ(bt_hfp_SemLock(), -1);
        EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    }
    EXPECT_THAT(fake::calls(), ElementsAre(kLink, kCreate));

    g_bt_hfp_share.area = area;
    g_bt_hfp_share.semaphore = lock;
    EXPECT_EQ(bt_hfp_SemLock(), 0);
    EXPECT_EQ(fake::held_locks(), 1u);
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(fake::stray_unlocks(), 0u) << "a failed lock does not unlock";
    EXPECT_EQ(bt_hfp_SemUnlock(), 0);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    EXPECT_EQ(fake::held_locks(), 0u);
}

TEST_F(HandsFreeStatus, InitialValuesCoverTheAreaAndNothingElse)
{
    const Bytes image = fake::hex("06000000 02000000*19 00*1004");
    const struct {
        const char* failing;
        int32_t result;
        bool written;
    } rows[] = {{"", 0, true},
                {"SemLock", -1, true},
                {"SemUnlock", -1, true},
                {"LinkShareData", -1, false},
                {"CreateSemaphore", -1, false}};
    for (const auto& row : rows) {
        fake::reset();
        g_bt_hfp_share = {};
        const uint8_t* const area = fake::area(kArea, 1100, 0xCC);
        fake::fail_only(row.failing);
        EXPECT_EQ(bt_hfp_InitShareMemData(), row.result) << row.failing;
        EXPECT_EQ(Bytes(area, area + 1084), row.written ? image : Bytes(1084, 0xCC)) << row.failing;
        EXPECT_EQ(Bytes(area + 1084, area + 1100), Bytes(16, 0xCC)) << row.failing;
        EXPECT_EQ(fake::held_locks(), 0u) << row.failing;
        EXPECT_LE(fake::deepest_lock(), 1u);
    }
    fake::reset();
    g_bt_hfp_share = {};
    fake::area(kArea, 1084, 0xCC);
    EXPECT_EQ(bt_hfp_InitShareMemData(), 0);
    for (const Query& row : kQueries)
        EXPECT_EQ(output_of(row, 0), Bytes(image.begin() + static_cast<std::ptrdiff_t>(row.offset),
                                           image.begin() + static_cast<std::ptrdiff_t>(row.offset + row.size)))
            << row.name;
}

} // namespace
