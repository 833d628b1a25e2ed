// Settings: kept in the field of the connection data area that the unit has for them, and always acknowledged.
#include "sim/connection_machines.h"
#include "sim/connection_store.h"

#include "wire/request.h"

#include <bt_service/bt_connection_store.h>

#include <cstring>

namespace bt::sim::con {

namespace {

// Words of the connect settings.
enum ConnectSetting : uint32_t { kAutomaticFirst, kAutomaticSecond, kConnectionRetry, kSdpEnforcement };

// Values of the scan mode: what the radio listens to (Write Scan Enable in the Bluetooth Core Specification).
enum ScanMode : uint32_t { kPageScan = 2, kInquiryAndPageScan = 3 };

struct Setting {
    bt::Request request;
    bool (*keep)(const Request& request);
};

bool keep_discoverable_mode(uint32_t mode)
{
    const uint32_t scan_mode = mode == 0 ? kPageScan : kInquiryAndPageScan;
    return bt_con_setDiscoverableStatus(&mode, 1) == 0 && bt_con_setScanMode(&scan_mode, 1) == 0;
}

bool keep_simple_pairing(const Request& request)
{
    uint8_t kept[8];
    const uint32_t words[2] = {request.number("first"), request.number("second")};
    std::memcpy(kept, words, sizeof kept);
    return bt_con_setSimplepairingCapability(kept, 1) == 0;
}

bool keep_link_loss_behaviour(const Request& request)
{
    uint8_t kept[32];
    const std::vector<uint32_t> words = request.numbers("behaviour");
    std::memcpy(kept, words.data(), sizeof kept);
    return bt_con_setLinkLossConnectSetVal(kept, 1) == 0;
}

bool keep_bluetooth_function(const Request& request)
{
    const uint32_t value = request.number("value");
    return bt_con_setBluetoothSetVal(&value, 1) == 0;
}

constexpr Setting kSettings[] = {
    {bt::Request::CON_setDiscoverableMode,
     [](const Request& request) { return keep_discoverable_mode(request.number("mode")); }},
    {bt::Request::CON_setAutomaticConnectionBehavior,
     [](const Request& request) {
         return bt_con_setSettingStatusVtype(request.number("first"), kAutomaticFirst) == 0 &&
                bt_con_setSettingStatusVtype(request.number("second"), kAutomaticSecond) == 0;
     }},
    {bt::Request::CON_setConnectionRetrySetting,
     [](const Request& request) {
         return bt_con_setSettingStatusVtype(request.number("value"), kConnectionRetry) == 0;
     }},
    {bt::Request::CON_setSDPEnforcementSetting,
     [](const Request& request) {
         return bt_con_setSettingStatusVtype(request.number("value"), kSdpEnforcement) == 0;
     }},
    {bt::Request::CON_setSimplePairing, keep_simple_pairing},
    {bt::Request::CON_setLinklossReconnectionBehavior, keep_link_loss_behaviour},
    {bt::Request::CON_setBluetoothFunction, keep_bluetooth_function},
};

} // namespace

uint32_t settings_state()
{
    return kServing;
}

void set_initial_settings()
{
    const uint32_t on = 1;
    keep_discoverable_mode(scenario->local.mode);
    bt_con_setBluetoothSetVal(&on, 1);
}

// A setting that has no field of its own is acknowledged as well.
void keep_setting(const Request& request)
{
    for (const Setting& setting : kSettings) {
        if (static_cast<uint16_t>(setting.request) != request.id()) continue;
        answer(request, setting.keep(request) ? BT_SIM_OK : BT_SIM_STORE_FAILED);
        return;
    }
    answer(request, BT_SIM_OK);
}

void tell_transmitting_power(const Request& request)
{
    const Phone* const phone = scenario->find(request.address());
    if (phone == nullptr)
        answer(request, BT_SIM_UNKNOWN_DEVICE);
    else if (connected_profiles(phone->address).empty())
        answer(request, BT_SIM_NOT_CONNECTED);
    else
        answer(request, BT_SIM_OK, {{"power", int64_t{phone->transmitting_power}}});
}

void not_expected(const Request& request)
{
    answer(request, BT_SIM_NOT_EXPECTED);
}

} // namespace bt::sim::con
