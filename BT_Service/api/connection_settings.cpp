// Requests to the connection service that carry plain values and need no checks.

#include "api/connection_post.h"

#include <bt_service/bt_connection.h>

using bt::Payload;
using bt::Request;
using bt::con::post;

int32_t BT_SRV_CON_TerminationRegistration()
{
    return post(Request::CON_TerminationRegistration);
}

int32_t BT_SRV_CON_restartAutomaticConnection()
{
    return post(Request::CON_restartAutomaticConnection);
}

int32_t BT_SRV_CON_suspendAutomaticConnection()
{
    return post(Request::CON_suspendAutomaticConnection);
}

int32_t BT_SRV_CON_cancelSearch()
{
    return post(Request::CON_cancelSearch, Payload().u32(0));
}

int32_t BT_SRV_CON_search(uint32_t value)
{
    return post(Request::CON_search, Payload().u32(value));
}

int32_t BT_SRV_CON_setDiscoverableMode(uint32_t mode)
{
    return post(Request::CON_setDiscoverableMode, Payload().u32(mode));
}

int32_t BT_SRV_CON_setSimplePairingDebugMode(uint32_t mode)
{
    return post(Request::CON_setSimplePairingDebugMode, Payload().u32(mode));
}

int32_t BT_SRV_CON_setBluetoothFunction(uint32_t value)
{
    return post(Request::CON_setBluetoothFunction, Payload().u32(value));
}

int32_t BT_SRV_CON_setBluetoothFunction_internal(uint32_t value)
{
    return post(Request::CON_setBluetoothFunction_internal, Payload().sent_by(PNO_BT_SYS).u32(value));
}

int32_t BT_SRV_CON_setSDPEnforcementSetting(uint32_t value)
{
    return post(Request::CON_setSDPEnforcementSetting, Payload().u32(value));
}

int32_t BT_SRV_CON_setConnectionRetrySetting(uint32_t value)
{
    return post(Request::CON_setConnectionRetrySetting, Payload().u32(value));
}

int32_t BT_SRV_CON_setAutomaticConnectionBehavior(uint32_t first, uint32_t second)
{
    return post(Request::CON_setAutomaticConnectionBehavior, Payload().u32(first).u32(second));
}

int32_t BT_SRV_CON_setSimplePairing(uint32_t first, uint32_t second)
{
    return post(Request::CON_setSimplePairing, Payload().u32(first).u32(second));
}

int32_t BT_SRV_CON_changeTimerValue(uint32_t first, uint32_t second)
{
    return post(Request::CON_changeTimerValue, Payload().u32(first).u32(second));
}

int32_t BT_SRV_CON_setLinklossReconnectionDirectionSetting(uint32_t first, uint32_t second)
{
    return post(Request::CON_setLinklossReconnectionDirectionSetting, Payload().u32(first).u32(second));
}

int32_t BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting(uint32_t first, uint32_t second)
{
    return post(Request::CON_setNoSecurityDeviceAuthenticationSetting, Payload().u32(first).u32(second));
}

int32_t BT_SRV_CON_setLinklossReconnectionBehavior(struct linkloss_behaviour behaviour)
{
    return post(Request::CON_setLinklossReconnectionBehavior, Payload().bytes(&behaviour, sizeof behaviour));
}
