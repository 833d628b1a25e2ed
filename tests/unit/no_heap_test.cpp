// The library lives without the heap: only a queue's second and further events are allocated. The rows of requests and
// of results watch the heap too.
#include "log_capture.h"
#include "request_rows.h"

#include <bt_service/bt_service.h>
#include <unistd.h>

#include <cstdlib>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define BT_SANITIZER_HAS_THE_HEAP
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define BT_SANITIZER_HAS_THE_HEAP
#endif
#endif

static thread_local bool counting = false;
static thread_local uint32_t heap_calls = 0;

uint32_t requests::heap_calls_of(const std::function<void()>& body)
{
    heap_calls = 0;
    counting = true;
    body();
    counting = false;
    return heap_calls;
}

#if defined(__GLIBC__) && !defined(BT_SANITIZER_HAS_THE_HEAP)

static thread_local bool no_memory = false; // for a queue's event

static void count()
{
    if (counting && !fake::inside()) ++heap_calls;
}

extern "C" {
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* memory, size_t size);
void __libc_free(void* memory);

void* malloc(size_t size) noexcept
{
    count();
    return no_memory && size == sizeof(BtQueueNode) ? nullptr : __libc_malloc(size);
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

using requests::call, requests::heap_calls_of;

BtMessage message = {}, taken;

TEST(NoHeap, StoreFrameworkAndEvents)
{
    const char *const address = "00*8", *const memory = "00*20000";
    fake::reset();
    fake::area("BT_CON_SHARE_DATA_NAME", 27796);
    fake::area("/tmp/shm_eds_regist_table", 8004);
    g_bt_con_share = {};
    for (const requests::Call& store :
         {call(bt_con_ApiInit, 0), call(bt_con_setRegisteredDeviceListInfoNoFROMWrite, "01 00*17343", 1),
          call(bt_con_getRegisteredDeviceListInfo, memory, 1),
          call(bt_con_getRegDev, address, memory, memory, memory, memory, memory),
          call(bt_con_getallConnectOrder, memory, 1), call(bt_con_addSearchdevlist, memory),
          call(bt_con_delSearchdevlist), call(bt_con_setSettingStatusVtype, 7, 1),
          call(BT_SRV_CON_getConnectionMode, address, memory), call(BT_SRV_CON_getRemoteDeviceInfo, address, memory),
          call(BT_SRV_CON_getLocalDeviceRole, address, memory),
          call(BT_SRV_CON_getRemoteDeviceList, 7, address, -1, memory),
          call(bt_con_IsCheckRegDevSupportProfile, memory, 1), call(BT_SRV_CON_getScanMode, memory)})
        EXPECT_EQ(store(), 0);
    g_bt_con_share = {}; // its area is gone

    const BtStateRow states[] = {{1, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, nullptr},
                                 {2, BT_CMN_nopEntryExit, BT_CMN_nopEntryExit, &states[0]},
                                 {BT_TABLE_END, nullptr, nullptr, nullptr}};
    const BtMatrixRow matrix[] = {{0xFFFE, 0, BT_CMN_errMtxFunc}, {BT_TABLE_END, 0, nullptr}};
    const BtDispatchRow dispatch[] = {{0, 1}, {BT_TABLE_END, 0}};
    const BtFunctionIdRow machines[] = {{1, [] { return uint32_t{0xFFFE}; }, matrix}, {BT_TABLE_END, nullptr, nullptr}};
    const std::string name = "/bt_no_heap_" + std::to_string(getpid());
    BtShmHandle object = {name.c_str(), 4096, -1, nullptr};
    fake::incoming(fake::Bytes(1024, 0));
    EXPECT_EQ(heap_calls_of([&] {
                  uint32_t state = 1;
                  const uint32_t id = 0xA891;
                  BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, &message);
                  BT_CMN_recvMsgWrapper("f", "g", 1, &taken);
                  BT_CMN_startTimer(1, 2);
                  BT_CMN_changeStatus(&state, 2, states);
                  BT_CMN_doMtxFunc(&message, dispatch, machines);
                  BT_CMN_createShm(&object);
                  BT_CMN_destroyShm(&object);
                  BT_CMN_logdump("CMN", "t", message.payload, 100);
                  BT_EDS_initialize();
                  const uint32_t listener = BT_SRV_EvtSrv_regist(0x4001, 1, 1, &id);
                  BT_EDS_dispatch(0, &message);
                  BT_SRV_EvtSrv_deregist(listener);
              }),
              0u);
    EXPECT_EQ(object.addr, nullptr);
}

TEST(NoHeap, QueueAllocatesOneNodeAnEventBeyondTheFirst)
{
    static BtQueueNode queue;
    queue.link = &queue;
    const auto add = [] { BT_CMN_enqueueMsg(&message, &queue); };
    const auto take = [] { BT_CMN_queueMsg(&taken, &queue); };
    for (const uint32_t calls : {0u, 1u, 1u})
        EXPECT_EQ(heap_calls_of(add), calls);
    no_memory = true;
    EXPECT_EQ(logged("CMN", add),
              (Lines{"[API][START] BT_CMN_enqueueMsg", "[api:BT_CMN_enqueueMsg] malloc err. ( event cnt = 3 ) ",
                     "[API][END] BT_CMN_enqueueMsg (1)"}));
    no_memory = false;
    for (const uint32_t calls : {1u, 1u, 0u, 0u})
        EXPECT_EQ(heap_calls_of(take), calls);
    EXPECT_EQ(queue.link, &queue);
}

} // namespace

#endif
