// What is known of the local device without asking the service.

#include <bt_platform/platform.h>
#include <bt_service/bt_system.h>

uint32_t g_setup_state[BT_SYS_SETUP_STATES] = {};

namespace {

constexpr char kLocalDeviceArea[] = "/tmp/shm_sysmgr_local_devinfo";

// The states that belong to profiles; any other index has the state below.
constexpr uint32_t kProfiles = 8;
constexpr int32_t kNoSuchProfile = 2;

const BtSysLocalDevice* link_local_device()
{
    void* area = nullptr;
    uint32_t size = sizeof(BtSysLocalDevice);
    return _sys_LinkShareData(kLocalDeviceArea, &area, &size) == 0 ? static_cast<BtSysLocalDevice*>(area) : nullptr;
}

} // namespace

int32_t BT_SRV_getLocalDeviceInformation(BtSysLocalDevice* out)
{
    if (out == nullptr) return BT_FAILED;
    const BtSysLocalDevice* const device = link_local_device();
    if (device == nullptr) return BT_FAILED;

    *out = *device;
    return BT_OK;
}

int32_t BT_SRV_getLocalDeviceDIDInfo(BtSysDid* out)
{
    if (out == nullptr) return BT_FAILED;
    const BtSysLocalDevice* const device = link_local_device();
    if (device == nullptr) return BT_FAILED;

    *out = device->did;
    return BT_OK;
}

int32_t BT_SRV_getEffectiveProfileState(uint32_t index)
{
    return index < kProfiles ? static_cast<int32_t>(g_setup_state[index]) : kNoSuchProfile;
}
