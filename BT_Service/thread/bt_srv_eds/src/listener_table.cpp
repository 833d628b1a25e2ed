#include "listener_table.h"

#include <bt_platform/platform.h>

namespace bt::eds {
namespace {

constexpr char kTableName[] = "/tmp/shm_eds_regist_table";
constexpr char kLockName[] = "BT_SRV_EDS_SEM_NAME";

} // namespace

bool TableLock::create()
{
    if (handle_.load() != 0) return true;

    // Two threads that come here at once get the same handle for the same name.
    const uint32_t handle = _sys_CreateSemaphore(kLockName);
    if (handle != 0) handle_.store(handle);
    return handle != 0;
}

bool TableLock::take()
{
    const uint32_t handle = handle_.load();
    if (_sys_SemLock(handle) == 0) return true;

    _sys_SemUnlock(handle);
    return false;
}

bool TableLock::release()
{
    return _sys_SemUnlock(handle_.load()) == 0;
}

BtEvtListenerTable* link_table()
{
    void* address = nullptr;
    uint32_t size = 0; // any size is asked for; a platform that does not report one leaves the zero
    if (_sys_LinkShareData(kTableName, &address, &size) != 0) return nullptr;

    const bool too_small = size != 0 && size < sizeof(BtEvtListenerTable);
    return too_small ? nullptr : static_cast<BtEvtListenerTable*>(address);
}

} // namespace bt::eds
