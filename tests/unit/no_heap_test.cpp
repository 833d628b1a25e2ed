// The library lives without the heap: only a queue's second and further events are allocated.
#include "fake_platform.h"

#include <bt_service/bt_service.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cstdlib>
#include <cstring>

#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define BT_SANITIZER_HAS_THE_HEAP
#endif
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define BT_SANITIZER_HAS_THE_HEAP
#endif

#if defined(__GLIBC__) && !defined(BT_SANITIZER_HAS_THE_HEAP)

namespace {

bool counting = false;
uint32_t heap_calls = 0;

void count()
{
    if (counting && !fake::inside()) ++heap_calls;
}

} // namespace

extern "C" {
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* memory, size_t size);
void __libc_free(void* memory);

void* malloc(size_t size) noexcept
{
    count();
    return __libc_malloc(size);
}
void* calloc(size_t number, size_t size) noexcept
{
    count();
    return __libc_calloc(number, size);
}
void* realloc(void* memory, size_t size) noexcept
{
    count();
    return __libc_realloc(memory, size);
}
void free(void* memory) noexcept
{
    if (memory != nullptr) count();
    __libc_free(memory);
}
}

namespace {

// Heap calls that the library makes, the platform's own left out.
template <class Body>
uint32_t heap_calls_of(Body body)
{
    heap_calls = 0;
    counting = true;
    body();
    counting = false;
    return heap_calls;
}

template <class... Result>
std::array<int32_t, sizeof...(Result)> results(Result... result)
{
    return {result...};
}

// Calls that all succeed, in no certain order.
template <class Body>
void expect_no_heap(Body body)
{
    decltype(body()) answers{};
    EXPECT_EQ(heap_calls_of([&] { answers = body(); }), 0u);
    EXPECT_THAT(answers, testing::Each(0));
}

// Memory of the caller for a parameter of any pointer type.
template <size_t Size>
struct Memory {
    template <class T>
    operator T*()
    {
        return static_cast<T*>(static_cast<void*>(bytes));
    }
    alignas(8) uint8_t bytes[Size];
};

Memory<30000> given; // zeros, but for what a test puts there
Memory<17344> devices; // a list of one, all zero but for the count
Memory<260000> out;
const BtDevAddress address = {};
uint32_t word;
int32_t number;

class NoHeap : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Stub;
        DebugConsoleLogSts = DebugFileOutLogSts = DebugSRVOutLogSts = 0;
        const std::pair<const char*, uint32_t> areas[] = {
            {"BT_CON_SHARE_DATA_NAME", 27796},   {"BT_HFP_SHARE_DATA_NAME", 1084},
            {"/tmp/shm_eds_regist_table", 8004}, {"/tmp/shm_sysmgr_local_devinfo", 348},
            {"/tmp/shm_avp_medialst", 28812},    {"/tmp/shm_avp_playerlst", 30012},
            {"/tmp/shm_avp_media", 1060},        {"/tmp/shm_map_serviceapi", 900},
            {"/tmp/shm_map_getmsg", 73713},      {"/tmp/shm_map_msglst", 247216},
            {"/tmp/shm_map_fldlst", 26004},      {"/tmp/shm_map_pushmsg", 9652},
            {"/tmp/shm_map_insinfo", 940}};
        for (const auto& [name, size] : areas)
            fake::area(name, size)[0] = 1; // one entry, where it is a count
        fake::find_area("/tmp/shm_avp_medialst")[4] = fake::find_area("/tmp/shm_avp_playerlst")[4] = 1;
        g_bt_con_share = {};
        g_bt_hfp_share = {};
        std::memset(&given, 0, sizeof given);
        devices.bytes[0] = 1;
    }
    void TearDown() override
    {
        g_bt_con_share = {}; // their areas are gone
        g_bt_hfp_share = {};
    }
};

TEST_F(NoHeap, Requests)
{
    expect_no_heap([] {
        return results(
            BT_SRV_CON_search(1), BT_SRV_CON_cancelSearch(), BT_SRV_CON_changeTimerValue(1, 2),
            BT_SRV_CON_setBluetoothFunction_internal(1), BT_SRV_CON_setLinklossReconnectionBehavior({}),
            BT_SRV_CON_delete(&address), BT_SRV_CON_permitProfileConnection(1, &address, 2),
            BT_SRV_CON_startServiceDiscovery_UUID(&address, given), BT_SRV_CON_authenticatePasskey(1, &address, given),
            BT_SRV_CON_authenticatePinCode(1, &address, given), BT_SRV_CON_requestConnection(&address, given),
            BT_SRV_CON_acceptConnection(1, &address, given), BT_SRV_CON_cancelConnection(&address, 1),
            BT_SRV_CON_requestDisconnection(&address, 1), BT_SRV_CON_requestAllDisconnection(1, &address),
            BT_SRV_HFP_dialNumber(given), BT_SRV_HFP_dialMemoryNumber(1), BT_SRV_HFP_answerCall(1, 2),
            BT_SRV_HFP_swapCall(), BT_SRV_HFP_sendDtmf(given), BT_SRV_HFP_setCodecValue(given),
            BT_SRV_HFP_sendGeneralPhoneATCommand(2, 0, 0), BT_SRV_OPP_pushResponseReq(given),
            BT_SRV_OPP_ConStsNotify(1, &address, 2), BT_SRV_PBAP_setSessionKey(given, 16),
            BT_SRV_initialize(given, given), BT_SRV_shutdown(), BT_SRV_setLocalDeviceName(given),
            BT_SRV_setLocalDeviceDIDInfo(given, 1, 2), BT_SRV_setConnectSCODevice(given), BT_SRV_simulation_Event(1, 2),
            BT_SRV_startFtsLog(given), BT_SRV_shapshotFtsLog(given, 64), BT_SRV_sendHciCommand(given),
            BT_SRV_testRxMode(given), BT_SRV_testTxMode(given), BT_SRV_testNonModulatedCarrier(given), BT_SRV_Reset(),
            BT_SRV_AVP_play(), BT_SRV_AVP_rewind(1), BT_SRV_AVP_setEq(1), BT_SRV_AVP_setCharacterCode({}),
            BT_SRV_AVP_selectFolder(given, given), BT_SRV_AVP_getMediaList(given), BT_SRV_AVP_searchItem(1, 490, given),
            BT_SRV_AVP_addNowPlaying(given, 1, 2), BT_SRV_AVP_STRCTL_setDeviceFileName(494, given),
            BT_SRV_MAP_changeDirectory(1, {}), BT_SRV_MAP_getFolderList(1, 2), BT_SRV_MAP_getMessageNum(1, {}),
            BT_SRV_MAP_getMessageList(1, {}), BT_SRV_MAP_getMessage(given), BT_SRV_MAP_deleteMessage({}),
            BT_SRV_MAP_saveMessage({}), BT_SRV_MAP_searchMessageList({}), BT_SRV_MAP_testMode({}));
    });
}

TEST_F(NoHeap, QueriesAndResults)
{
    list_result list = {0, 0, out};
    message_record record{};
    record.body = out;
    push_record push{};
    push.body = given;
    push.body_length = 2000;
    std::memset(fake::find_area("/tmp/shm_map_getmsg") + 8160, 1, 4);
    expect_no_heap([&] {
        return results(bt_hfp_InitShareMemData(), BT_SRV_CON_getScanMode(&word), BT_SRV_CON_getDiscoverableMode(&word),
                       BT_SRV_HFP_getSignalLevel(&word), BT_SRV_HFP_getCallList(out), BT_SRV_HFP_getCallInfo(1, out),
                       BT_SRV_getLocalDeviceInformation(out), BT_SRV_getLocalDeviceDIDInfo(out),
                       BT_SRV_getEffectiveProfileState(1), BT_SRV_AVP_getMediaListData(0, 100, &list),
                       BT_SRV_AVP_getPlayerListData(0, 100, &list), BT_SRV_AVP_getMediaData(out),
                       BT_SRV_MAP_getMessageData(&record), BT_SRV_MAP_getMessageData_ex(10, &record),
                       BT_SRV_MAP_getMessageListData(&word, out), BT_SRV_MAP_getFolderListData_ex(3, &word, out),
                       BT_SRV_MAP_getMasServiceInfo(out), BT_SRV_MAP_setPushMessageData(push));
    });
    shm_unlink("BT_SRV_MAP_SERVICE_INFO");
}

TEST_F(NoHeap, DataStore)
{
    expect_no_heap([] { return results(bt_con_ApiInit(0)); });
    expect_no_heap([] { return results(bt_con_setRegisteredDeviceListInfoNoFROMWrite(devices, 1)); });
    expect_no_heap([] {
        return results(bt_con_getRegisteredDeviceListInfo(out, 1), bt_con_getProfileConnectedOrderList(out, 1),
                       bt_con_setSearchDevlist(given, 1), bt_con_setConnectSetVal(given, 1),
                       bt_con_getRegDev(&address, out, &number, &word, &word, &word),
                       bt_con_getRegisterDeviceName(&address, out), bt_con_getRegisterDeviceIndex(&address),
                       bt_con_getRegisterDeviceNum(&number), bt_con_getallOrderList(out),
                       bt_con_getallConnectOrder(out, 1), bt_con_addSearchdevlist(given), bt_con_delSearchdevlist(),
                       bt_con_getSettingStatusVtype(&word, 1), bt_con_setSettingStatusVtype(7, 1),
                       BT_SRV_CON_getConnectionMode(&address, &word), BT_SRV_CON_getRemoteDeviceInfo(&address, out),
                       bt_con_IsCheckRegDevSupportProfile(given, 1), bt_con_IsCheckProfileFilter(given, 1));
    });
    EXPECT_EQ(heap_calls_of([] { // which find nothing
                  bt_con_calcSum(given, 19148);
                  bt_con_SearshOrderListAddr(&address, &number);
                  bt_con_getRegisteredDeviceDIDInfo(&address, 1, out);
                  BT_SRV_CON_getRemoteDeviceDIDInfo(&address, 1, out);
              }),
              0u);
}

TEST_F(NoHeap, FrameworkAndEvents)
{
    const BtStateRow states[] = {{1, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
                                 {2, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, &states[0]},
                                 {BT_TABLE_END, nullptr, nullptr, nullptr}};
    const BtMatrixRow matrix[] = {{0xFFFE, 0, BT_CMN_errMtxFunc}, {BT_TABLE_END, 0, nullptr}};
    const BtDispatchRow dispatch[] = {{0, 1}, {BT_TABLE_END, 0}};
    const BtFunctionIdRow machines[] = {{1, [] { return uint32_t{0xFFFE}; }, matrix}, {BT_TABLE_END, nullptr, nullptr}};
    const BtResponseRow responses[] = {{1, 2, 3}, {BT_RESPONSE_END, BT_RESPONSE_END, 0}};
    const std::string name = "/bt_no_heap_" + std::to_string(getpid());
    BtShmHandle object = {name.c_str(), 4096, -1, nullptr};
    fake::incoming(fake::Bytes(1024, 0));
    const uint32_t calls = heap_calls_of([&] {
        BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, given);
        BT_CMN_recvMsgWrapper("f", "g", 1, out);
        uint16_t id;
        BT_CMN_get_response_from_request(responses, 1, &id, &id);
        BT_CMN_startTimer(1, 2);
        BT_CMN_stopTimer(1);
        uint32_t state = 1;
        BT_CMN_changeStatus(&state, 2, states);
        BT_CMN_doMtxFunc(given, dispatch, machines);
        BT_CMN_LONG2BIG(1, out);
        BT_CMN_BIG2SHORT(given);
        BT_CMN_createShm(&object);
        BT_CMN_destroyShm(&object);
        BT_CMN_logdump("CMN", "t", given, 100);

        BT_EDS_initialize();
        word = BT_SRV_EvtSrv_regist(0x4001, 1, 1, given);
        BT_SRV_EvtSrv_suspend(word);
        BT_SRV_EvtSrv_resume(word);
        BT_EDS_dispatch(0, given);
        BT_SRV_EvtSrv_deregist(word);
    });
    EXPECT_EQ(calls, 0u);
    EXPECT_EQ(object.addr, nullptr);
}

TEST_F(NoHeap, QueueAllocatesOneNodeAnEventBeyondTheFirst)
{
    static BtQueueNode queue;
    queue.link = &queue;
    const auto add = [] { BT_CMN_enqueueMsg(given, &queue); };
    const auto take = [] { BT_CMN_queueMsg(out, &queue); };
    EXPECT_EQ(heap_calls_of(add), 0u);
    EXPECT_EQ(heap_calls_of(take), 0u);
    EXPECT_EQ(heap_calls_of(take), 0u) << "empty";
    EXPECT_EQ(heap_calls_of(add), 0u);
    EXPECT_EQ(heap_calls_of(add), 1u);
    EXPECT_EQ(heap_calls_of(add), 1u);
    EXPECT_EQ(heap_calls_of(take), 1u);
    EXPECT_EQ(heap_calls_of(take), 1u);
    EXPECT_EQ(heap_calls_of(take), 0u);
    EXPECT_EQ(queue.link, &queue);
}

} // namespace

#endif
