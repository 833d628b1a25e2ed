// The hands-free status area: its queries, its lock, its initial values, and attaching to both.
#include "request_rows.h"

#include <bt_service/bt_hands_free.h>
#include <gmock/gmock.h>

namespace {

using fake::Bytes;
using requests::output_of;
using testing::ElementsAre;

const char* const kArea = "BT_HFP_SHARE_DATA_NAME";
const std::string kLink = "LinkShareData(BT_HFP_SHARE_DATA_NAME)", kCreate = "CreateSemaphore(BT_HFP_SEMAPHORE_NAME)";
const std::string kLock = "SemLock", kUnlock = "SemUnlock";

struct Query {
    uint32_t offset, size;
    std::function<int32_t(void*)> call;
};

template <class Output>
Query query(uint32_t offset, int32_t (*function)(Output*))
{
    return {offset, sizeof(Output), [=](void* out) { return function(static_cast<Output*>(out)); }};
}

Query call_info(uint32_t index, uint32_t offset = 0)
{
    return {offset, 100, [=](void* out) { return BT_SRV_HFP_getCallInfo(index, static_cast<BtHfpCall*>(out)); }};
}

const Query kQueries[] = {query(0, BT_SRV_HFP_getSignalLevel),
                          query(4, BT_SRV_HFP_getServiceAreaStatus),
                          query(8, BT_SRV_HFP_getRoamingStatus),
                          query(12, BT_SRV_HFP_getAudioLinkStatus),
                          query(16, BT_SRV_HFP_getAGSupportFunction),
                          query(32, BT_SRV_HFP_getSupportInbandRingTone),
                          query(52, BT_SRV_HFP_getSupportThreewayCall),
                          query(80, BT_SRV_HFP_getCallList),
                          call_info(0, 84),
                          call_info(9, 984)};
static_assert(sizeof(BtHfpAgFunctions) == 36 && sizeof(BtHfpThreewayCall) == 28 && sizeof(BtHfpCallList) == 1004);

// Every test starts as a process that has attached nothing.
class HandsFreeStatus : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        g_bt_hfp_share = {};
        area = fake::area(kArea, 1084); // no two neighbouring words are equal; it ends where its last byte does
        for (size_t i = 0; i < 1084; ++i)
            area[i] = static_cast<uint8_t>(i * 7 + i / 256);
    }
    void TearDown() override { g_bt_hfp_share = {}; }

    uint8_t* area = nullptr;
};

TEST_F(HandsFreeStatus, HandleGrowsStepByStepAndStays)
{
    EXPECT_EQ(bt_hfp_getShareMemAccessPtr(), &g_bt_hfp_share);
    fake::fail_from(1);
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1) << "nothing there";
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    fake::fail_from(0);
    fake::fail_only("CreateSemaphore");
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1) << "no lock yet";
    EXPECT_EQ(g_bt_hfp_share.area, area);
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    fake::fail_only("");
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), 0);
    EXPECT_EQ(g_bt_hfp_share.semaphore, fake::lock_handle("BT_HFP_SEMAPHORE_NAME"));
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), 0);
    EXPECT_THAT(fake::calls(), ElementsAre(kLink, kCreate, kLink, kCreate, kCreate));
    EXPECT_THAT(fake::sizes_asked(), ElementsAre(0u, 0u));

    EXPECT_EQ(bt_hfp_SemLock(), 0);
    EXPECT_EQ(fake::held_locks(), 1u);
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(fake::stray_unlocks(), 0u) << "a failed lock does not unlock";
    EXPECT_EQ(bt_hfp_SemUnlock(), 0);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
    g_bt_hfp_share = {};
    fake::fail_only("LinkShareData");
    EXPECT_EQ(bt_hfp_ShareMemAccessInit(), -1);
    EXPECT_EQ(g_bt_hfp_share.area, nullptr);
    EXPECT_NE(g_bt_hfp_share.semaphore, 0u) << "a failed link does not stop the lock";
    EXPECT_EQ(bt_hfp_SemLock(), -1);
    EXPECT_EQ(bt_hfp_SemUnlock(), -1);
}

TEST_F(HandsFreeStatus, QueriesCopyTheirFieldOnceAreaAndLockAreThere)
{
    const struct {
        std::string failing;
        bool copied;
        std::vector<std::string> calls, more_calls; // and of a second query, when nothing fails any more
    } rows[] = {{"", true, {kLink, kCreate, kLock, kUnlock}, {kLock, kUnlock}},
                {kLock, true, {kLink, kCreate, kLock, kUnlock}, {kLock, kUnlock}},
                {kUnlock, true, {kLink, kCreate, kLock, kUnlock}, {kLock, kUnlock}},
                {"LinkShareData", false, {kLink, kCreate}, {kLink, kLock, kUnlock}},
                {"CreateSemaphore", false, {kLink, kCreate}, {kCreate, kLock, kUnlock}}};
    for (const Query& query : kQueries)
        for (const auto& row : rows) {
            SCOPED_TRACE(testing::Message() << query.offset << " " << row.failing);
            SetUp();
            const Bytes field(area + query.offset, area + query.offset + query.size);
            fake::fail_only(row.failing.c_str());
            EXPECT_EQ(output_of(query.size, query.call, row.copied ? 0 : -1), row.copied ? field : Bytes());
            fake::fail_only("");
            EXPECT_EQ(output_of(query.size, query.call, 0), field);
            std::vector<std::string> calls = row.calls;
            calls.insert(calls.end(), row.more_calls.begin(), row.more_calls.end());
            EXPECT_EQ(fake::calls(), calls);
            EXPECT_EQ(fake::held_locks(), 0u);
            EXPECT_EQ(fake::deepest_lock(), 1u);
            EXPECT_EQ(fake::stray_unlocks(), row.failing == kLock ? 1u : 0u) << "the closing unlock alone";
        }
}

TEST_F(HandsFreeStatus, NullOutputsAndCallsThatAreNoneTouchNothing)
{
    for (const Query& row : kQueries)
        EXPECT_EQ(row.call(nullptr), -1) << row.offset;
    for (const uint32_t index : {10u, 256u, 42949673u, 0x80000000u, UINT32_MAX}) { // 42949673 * 100 is 4 in 32 bits
        EXPECT_EQ(output_of(100, call_info(index).call, -1), Bytes()) << index;
        EXPECT_EQ(call_info(index).call(nullptr), -1) << index;
    }
    EXPECT_THAT(fake::calls(), ElementsAre());
}

TEST_F(HandsFreeStatus, InitialValuesCoverTheAreaAndNothingElse)
{
    const struct {
        const char* failing;
        int32_t result;
        const char* area;
    } rows[] = {{"", 0, "06000000 02000000*19 00*1004 CC*16"},
                {"SemLock", -1, "06000000 02000000*19 00*1004 CC*16"},
                {"SemUnlock", -1, "06000000 02000000*19 00*1004 CC*16"},
                {"LinkShareData", -1, "CC*1100"},
                {"CreateSemaphore", -1, "CC*1100"}};
    for (const auto& row : rows) {
        SetUp();
        area = fake::area(kArea, 1100, 0xCC);
        fake::fail_only(row.failing);
        EXPECT_EQ(requests::without_heap_or_log(bt_hfp_InitShareMemData), row.result) << row.failing;
        EXPECT_EQ(Bytes(area, area + 1100), fake::hex(row.area)) << row.failing;
        EXPECT_EQ(fake::held_locks(), 0u) << row.failing;
    }
}

} // namespace
