// The connection requests and queries.
#include "btsvc/calls.h"
#include "btsvc/device_record.h"
#include "btsvc/unit.h"
#include "catalogue/print.h"

#include <bt_service/bt_connection.h>
#include <bt_service/bt_connection_queries.h>

#include <algorithm>
#include <iterator>

namespace bt::client {
namespace {

using Answer = nlohmann::ordered_json;
using Args = Arguments;

constexpr int32_t kMostRecords = 100;

const BtDevAddress* address(const Args& a, size_t i)
{
    return a.record<BtDevAddress>(i);
}

int32_t device_list(const Args& a, Answer& out)
{
    require_connection_area(); // the call itself reports every failure as an empty list
    std::vector<BtConRegDevInfo> records(static_cast<size_t>(std::clamp(a.i32(2), 1, kMostRecords)));
    const int32_t maximum = std::min(a.i32(2), kMostRecords);
    const int32_t count = BT_SRV_CON_getRemoteDeviceList(a.u32(0), a.record<int32_t>(1), maximum, records.data());
    out["devices"] = Answer::array();
    for (int32_t i = 0; i < count && i < maximum; ++i)
        out["devices"].push_back(device_json(records[static_cast<size_t>(i)]));
    return count;
}

int32_t device_info(const Args& a, Answer& out)
{
    BtConRegDevInfo record{};
    const int32_t result = BT_SRV_CON_getRemoteDeviceInfo(address(a, 0), &record);
    if (result == BT_OK) out["device"] = device_json(record);
    return result;
}

int32_t device_id(const Args& a, Answer& out)
{
    std::vector<uint8_t> value(BT_CON_DID_VALUE_SIZE);
    const int32_t result = BT_SRV_CON_getRemoteDeviceDIDInfo(address(a, 0), a.u32(1), value.data());
    if (result == BT_OK) out["value"] = catalogue::hex_text(value);
    return result;
}

int32_t device_word(int32_t (*query)(const BtDevAddress*, uint32_t*), const char* name, const Args& a, Answer& out)
{
    uint32_t word = 0;
    const int32_t result = query(address(a, 0), &word);
    if (result == BT_OK) out[name] = word;
    return result;
}

int32_t local_word(int32_t (*query)(uint32_t*), const char* name, Answer& out)
{
    uint32_t word = 0;
    const int32_t result = query(&word);
    if (result == BT_OK) out[name] = word;
    return result;
}

// clang-format off
constexpr Call kCalls[] = {
    {"CON_search", "value:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_search(a.u32(0)); }},
    {"CON_cancelSearch", "",
     [](const Args&, Answer&) { return BT_SRV_CON_cancelSearch(); }},
    {"CON_TerminationRegistration", "",
     [](const Args&, Answer&) { return BT_SRV_CON_TerminationRegistration(); }},
    {"CON_delete", "address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_delete(address(a, 0)); }},
    {"CON_startServiceDiscovery", "address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_startServiceDiscovery(address(a, 0)); }},
    {"CON_startServiceDiscovery_UUID", "address:addr service_id:bytes[24]",
     [](const Args& a, Answer&) { return BT_SRV_CON_startServiceDiscovery_UUID(address(a, 0), a.record<BtConServiceId>(1)); }},
    {"CON_queryRemoteDeviceDIDInfo", "address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_queryRemoteDeviceDIDInfo(address(a, 0)); }},
    {"CON_getTransmittingPower", "address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_getTransmittingPower(address(a, 0)); }},

    {"CON_authenticateNumericValue", "reply:u32 address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_authenticateNumericValue(a.u32(0), address(a, 1)); }},
    {"CON_authenticatePasskey", "reply:u32 address:addr passkey:bytes[8]",
     [](const Args& a, Answer&) { return BT_SRV_CON_authenticatePasskey(a.u32(0), address(a, 1), a.record<BtConPasskey>(2)); }},
    {"CON_authenticatePinCode", "reply:u32 address:addr pin:bytes[20]",
     [](const Args& a, Answer&) { return BT_SRV_CON_authenticatePinCode(a.u32(0), address(a, 1), a.record<BtConPinCode>(2)); }},

    {"CON_requestConnection", "address:addr parameters:u32[7]",
     [](const Args& a, Answer&) { return BT_SRV_CON_requestConnection(address(a, 0), a.record<BtConParameters>(1)); }},
    {"CON_requestConnection_Ex", "address:addr parameters:u32[7] selector:u32[1]",
     [](const Args& a, Answer&) { return BT_SRV_CON_requestConnection_Ex(address(a, 0), a.record<BtConParameters>(1), a.record<uint32_t>(2)); }},
    {"CON_acceptConnection", "first:u32 address:addr filter:u32[9]",
     [](const Args& a, Answer&) { return BT_SRV_CON_acceptConnection(a.u32(0), address(a, 1), a.record<BtConProfileFilterBlock>(2)); }},
    {"CON_permitProfileConnection", "first:u32 address:addr second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_permitProfileConnection(a.u32(0), address(a, 1), a.u32(2)); }},
    {"CON_cancelConnection", "address:addr profile:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_cancelConnection(address(a, 0), a.u32(1)); }},
    {"CON_cancelConnection_Ex", "address:addr profile:u32 selector:u32[1]",
     [](const Args& a, Answer&) { return BT_SRV_CON_cancelConnection_Ex(address(a, 0), a.u32(1), a.record<uint32_t>(2)); }},
    {"CON_cancelRemoteDeviceConnection", "address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_cancelRemoteDeviceConnection(address(a, 0)); }},
    {"CON_requestDisconnection", "address:addr profile:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_requestDisconnection(address(a, 0), a.u32(1)); }},
    {"CON_requestDisconnection_Ex", "address:addr profile:u32 selector:u32[1]",
     [](const Args& a, Answer&) { return BT_SRV_CON_requestDisconnection_Ex(address(a, 0), a.u32(1), a.record<uint32_t>(2)); }},
    {"CON_requestAllDisconnection", "flag:u32 address:addr",
     [](const Args& a, Answer&) { return BT_SRV_CON_requestAllDisconnection(a.u32(0), address(a, 1)); }},

    {"CON_restartAutomaticConnection", "",
     [](const Args&, Answer&) { return BT_SRV_CON_restartAutomaticConnection(); }},
    {"CON_suspendAutomaticConnection", "",
     [](const Args&, Answer&) { return BT_SRV_CON_suspendAutomaticConnection(); }},
    {"CON_setAutomaticConnectionBehavior", "first:u32 second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setAutomaticConnectionBehavior(a.u32(0), a.u32(1)); }},
    {"CON_setConnectionRetrySetting", "value:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setConnectionRetrySetting(a.u32(0)); }},
    {"CON_setLinklossReconnectionBehavior", "behaviour:u32[9]",
     [](const Args& a, Answer&) { return BT_SRV_CON_setLinklossReconnectionBehavior(a.value<BtConLinklossBehaviour>(0)); }},
    {"CON_setLinklossReconnectionDirectionSetting", "first:u32 second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setLinklossReconnectionDirectionSetting(a.u32(0), a.u32(1)); }},

    {"CON_setBluetoothFunction", "value:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setBluetoothFunction(a.u32(0)); }},
    {"CON_setBluetoothFunction_internal", "value:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setBluetoothFunction_internal(a.u32(0)); }},
    {"CON_setDiscoverableMode", "mode:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setDiscoverableMode(a.u32(0)); }},
    {"CON_setSimplePairing", "first:u32 second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setSimplePairing(a.u32(0), a.u32(1)); }},
    {"CON_setSimplePairingDebugMode", "mode:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setSimplePairingDebugMode(a.u32(0)); }},
    {"CON_setNoSecurityDeviceAuthenticationSetting", "first:u32 second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting(a.u32(0), a.u32(1)); }},
    {"CON_setSDPEnforcementSetting", "value:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_setSDPEnforcementSetting(a.u32(0)); }},
    {"CON_changeTimerValue", "first:u32 second:u32",
     [](const Args& a, Answer&) { return BT_SRV_CON_changeTimerValue(a.u32(0), a.u32(1)); }},

    {"CON_getConnectionMode", "address:addr",
     [](const Args& a, Answer& out) { return device_word(BT_SRV_CON_getConnectionMode, "mode", a, out); }},
    {"CON_getLocalDeviceRole", "address:addr",
     [](const Args& a, Answer& out) { return device_word(BT_SRV_CON_getLocalDeviceRole, "role", a, out); }},
    {"CON_getRemoteDeviceInfo", "address:addr", device_info},
    {"CON_getRemoteDeviceList", "unused:u32 value:i32[1] maximum:i32", device_list, Call::Result::count},
    {"CON_getScanMode", "",
     [](const Args&, Answer& out) { return local_word(BT_SRV_CON_getScanMode, "mode", out); }},
    {"CON_getDiscoverableMode", "",
     [](const Args&, Answer& out) { return local_word(BT_SRV_CON_getDiscoverableMode, "mode", out); }},
    {"CON_getRemoteDeviceDIDInfo", "address:addr key:u32", device_id},
};
// clang-format on

} // namespace

CallTable connection_calls()
{
    return {std::begin(kCalls), std::end(kCalls)};
}

} // namespace bt::client
