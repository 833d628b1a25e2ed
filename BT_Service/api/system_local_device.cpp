// What is known of the local device without asking the service.

#include "api/linked_area.h"

#include <bt_service/bt_system.h>

#include <cstddef>
#include <cstring>

uint32_t g_setup_state[BT_SYS_SETUP_STATES] = {};

namespace {

constexpr char kLocalDeviceArea[] = "/tmp/shm_sysmgr_local_devinfo";

// The states that belong to profiles; any other index has the state below.
constexpr uint32_t kProfiles = 8;
constexpr int32_t kNoSuchProfile = 2;

// Copies `length` bytes at `offset` of the record, when all of the record is there.
int32_t copy_out(void* out, uint32_t offset, uint32_t length)
{
    if (out == nullptr) return BT_FAILED;
    const bt::LinkedArea area(kLocalDeviceArea, sizeof(BtSysLocalDevice), sizeof(BtSysLocalDevice));
    if (!area.has(sizeof(BtSysLocalDevice))) return BT_FAILED;

    std::memcpy(out, area.at(offset), length);
    return BT_OK;
}

} // namespace

int32_t BT_SRV_getLocalDeviceInformation(BtSysLocalDevice* out)
{
    return copy_out(out, 0, sizeof *out);
}

int32_t BT_SRV_getLocalDeviceDIDInfo(BtSysDid* out)
{
    return copy_out(out, offsetof(BtSysLocalDevice, did), sizeof *out);
}

int32_t BT_SRV_getEffectiveProfileState(uint32_t index)
{
    return index < kProfiles ? static_cast<int32_t>(g_setup_state[index]) : kNoSuchProfile;
}
