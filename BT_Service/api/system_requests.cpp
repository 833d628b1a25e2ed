// Requests to the system service: start and stop, the local device, the FTS log.

#include "wire/post.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_system.h>

using bt::Payload;
using bt::Request;

namespace {

int32_t post(Request request)
{
    return bt::post(PNO_BT_SYS, request);
}

int32_t post(Request request, Payload& payload)
{
    return bt::post(PNO_BT_SYS, request, payload);
}

Payload& append_name(Payload& payload, const BtSysName& name)
{
    return payload.u8(name.length).zeros(sizeof name.reserved).bytes(name.text, name.length);
}

int32_t post_start(Request request, const BtSysStart* start, const BtSysName* name)
{
    if (start == nullptr || name == nullptr) return BT_FAILED;
    if (name->length > BT_SYS_START_NAME_MAX) return BT_FAILED;

    return post(request, append_name(Payload().bytes(start, sizeof *start), *name));
}

} // namespace

int32_t BT_SRV_initialize(const BtSysStart* start, const BtSysName* name)
{
    _sys_SetupZX44API(1);
    return post_start(Request::initialize, start, name);
}

int32_t BT_SRV_resetBtFunction(const BtSysStart* start, const BtSysName* name)
{
    return post_start(Request::resetBtFunction, start, name);
}

int32_t BT_SRV_deinitialize(uint32_t value)
{
    return post(Request::deinitialize, Payload().u32(value));
}

int32_t BT_SRV_shutdown()
{
    return post(Request::shutdown);
}

int32_t BT_SRV_radioShutdown()
{
    return post(Request::radioShutdown);
}

int32_t BT_SRV_setHciMode()
{
    return post(Request::setHciMode);
}

int32_t BT_SRV_getSoftVersion()
{
    return post(Request::getSoftVersion);
}

int32_t BT_SRV_stopFtsLog()
{
    return post(Request::stopFtsLog);
}

int32_t BT_SRV_setLocalDeviceName(const BtSysName* name)
{
    if (name == nullptr) return BT_FAILED;

    Payload payload;
    return post(Request::setLocalDeviceName, append_name(payload, *name));
}

int32_t BT_SRV_setLocalDeviceDIDInfo(const BtSysDid* did, uint8_t value8, uint32_t value32)
{
    if (did == nullptr) return BT_FAILED;
    if (value8 == 0 || value32 == 0) return BT_FAILED;

    return post(Request::setLocalDeviceDIDInfo, Payload().bytes(did, sizeof *did).u8(value8).u32(value32));
}

int32_t BT_SRV_setEffectiveProfile(uint32_t value)
{
    if (value > BT_SYS_EFFECTIVE_PROFILE_MAX) return BT_FAILED;

    return post(Request::setEffectiveProfile, Payload().u32(value));
}

int32_t BT_SRV_setConnectSCODevice(const BtSysScoDevice* device)
{
    if (device == nullptr) return BT_FAILED;

    return post(Request::setConnectSCODevice, Payload().bytes(device, sizeof *device));
}

int32_t BT_SRV_simulation_Event(uint32_t first, uint32_t second)
{
    return post(Request::simulation_Event, Payload().u32(first).u8(second).zeros(3));
}

int32_t BT_SRV_startFtsLog(const BtSysFtsStart* start)
{
    if (start == nullptr) return BT_FAILED;

    return post(Request::startFtsLog, Payload().bytes(start, sizeof *start));
}

int32_t BT_SRV_shapshotFtsLog(const void* data, uint32_t length)
{
    if (length > BT_SYS_FTS_SNAPSHOT_MAX) return BT_FAILED;

    return post(Request::shapshotFtsLog, Payload().bytes_or_zeros(data, length));
}

int32_t BT_SRV_setFtsLogSize(uint32_t size)
{
    if (size > BT_SYS_FTS_LOG_SIZE_MAX) return BT_FAILED;

    return post(Request::setFtsLogSize, Payload().u32(size));
}
