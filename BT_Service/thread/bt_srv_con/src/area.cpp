// Attaches the connection data area, guards it with its lock, and holds its one reader and its one writer.
#include "thread/bt_srv_con/src/area.h"

#include <bt_platform/platform.h>

#include "thread/bt_srv_con/src/process_lock.h"

BtConShareHandle g_bt_con_share = {0, nullptr};

namespace bt::con {
namespace {

pthread_mutex_t g_attaching = PTHREAD_MUTEX_INITIALIZER;

uint32_t semaphore()
{
    return __atomic_load_n(&g_bt_con_share.semaphore, __ATOMIC_ACQUIRE);
}

int32_t link_area()
{
    void* linked = nullptr;
    uint32_t any_size = 0;
    const int32_t result = _sys_LinkShareData(BT_CON_SHARE_DATA_NAME, &linked, &any_size);
    if (result != BT_OK) return result;

    __atomic_store_n(&g_bt_con_share.area, linked, __ATOMIC_RELEASE);
    return BT_OK;
}

bool usable(const void* field, const void* buffer, uint32_t size)
{
    return area() != nullptr && field != nullptr && buffer != nullptr && size != 0;
}

} // namespace

BtConShareData* area()
{
    return static_cast<BtConShareData*>(__atomic_load_n(&g_bt_con_share.area, __ATOMIC_ACQUIRE));
}

} // namespace bt::con

using namespace bt::con;

BtConShareHandle* bt_con_getShareMemAccessPtr(void)
{
    return &g_bt_con_share;
}

int32_t bt_con_ApiInit(uint32_t mode)
{
    // Threads that come while the first one loads the image wait until the area is whole.
    const ProcessLock one_at_a_time(g_attaching);

    if (area() == nullptr) {
        const int32_t linked = link_area();
        if (linked != BT_OK) return linked;
    }
    if (semaphore() != 0) return BT_OK;

    const uint32_t created = _sys_CreateSemaphore(BT_CON_SEMAPHORE_NAME);
    if (created == 0) return BT_NO_SEMAPHORE;
    __atomic_store_n(&g_bt_con_share.semaphore, created, __ATOMIC_RELEASE);

    if (mode == 1) bt_con_readFROM();
    return BT_OK;
}

int32_t bt_con_semLock(void)
{
    const uint32_t handle = semaphore();
    if (handle == 0) return BT_OK;

    const int32_t result = _sys_SemLock(handle);
    if (result != BT_OK) _sys_SemUnlock(handle);
    return result;
}

int32_t bt_con_semUnlock(void)
{
    const uint32_t handle = semaphore();
    return handle == 0 ? BT_OK : _sys_SemUnlock(handle);
}

int32_t bt_con_getter(const void* field, void* buffer, uint32_t size, uint32_t lock_flag)
{
    if (!usable(field, buffer, size)) return BT_FAILED;
    if (lock_flag != 1) {
        load(buffer, field, size);
        return BT_OK;
    }
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();
    load_held(buffer, field, size);
    return lock.release();
}

int32_t bt_con_setter(void* field, const void* buffer, uint32_t size, uint32_t write_from, uint32_t lock_flag)
{
    if (!usable(field, buffer, size)) return BT_FAILED;
    // Compared before the lock is taken: an unchanged store costs no lock and no image write.
    if (holds(field, buffer, size)) return BT_OK;

    if (lock_flag == 1) {
        AreaLock lock;
        if (lock.taken() != BT_OK) return lock.taken();
        store(field, buffer, size);
        const int32_t released = lock.release();
        if (released != BT_OK) return released;
    } else {
        store(field, buffer, size);
    }
    if (write_from == 1) bt_con_writeFROM();
    return BT_OK;
}
