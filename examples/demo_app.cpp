// The application of the demonstration: an application's usual day with a unit, each step shown and checked.
#include "demo_steps.h"

#include "catalogue/print.h"

#include <bt_platform/host.h>
#include <bt_service/bt_service.h>
#include <bt_sim/events.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

using demo::bytes_of;
using demo::Decoded;
using demo::number_of;
using demo::Steps;

constexpr uint32_t kProfile = 0;

BtDevAddress address_of(const Decoded& event)
{
    BtDevAddress address{};
    const std::vector<uint8_t> bytes = bytes_of(event, "address");
    if (bytes.size() == sizeof address) std::memcpy(&address, bytes.data(), sizeof address);
    return address;
}

std::string text_of(const BtDevAddress& address)
{
    return bt::catalogue::address_text(address.address);
}

uint32_t register_for_events(Steps& steps)
{
    steps.begin("Register for events");
    steps.expect(bt_host_claim_pno(BT_HOST_ANY_PNO) == 0, bt_host_error());
    const std::vector<uint32_t> ids{BT_SIM_EVENT_CON_SEARCH,     BT_SIM_EVENT_CON_DEVICE_FOUND,
                                    BT_SIM_EVENT_CON_CONNECTION, BT_SIM_EVENT_CON_REGISTERED,
                                    BT_SIM_EVENT_CON_CONNECTED,  BT_SIM_EVENT_CON_REMOTE_DID};
    steps.asked("BT_SRV_EvtSrv_regist with " + std::to_string(ids.size()) + " event ids");
    const uint32_t handle = BT_SRV_EvtSrv_regist(_sys_GetPno(), 0, static_cast<uint32_t>(ids.size()), ids.data());
    steps.answered("handle " + std::to_string(handle));
    steps.expect(handle != 0, "the registration was refused");
    return handle;
}

BtDevAddress search(Steps& steps)
{
    steps.begin("Search for devices");
    steps.asked("BT_SRV_CON_search(0)");
    steps.expect(BT_SRV_CON_search(0) == BT_OK, "the request was not posted");
    const auto answer = steps.await("CON_search");
    steps.expect(answer && number_of(*answer, "result") == BT_SIM_OK, "the search did not end well");

    const auto found = std::find_if(steps.events().begin(), steps.events().end(),
                                    [](const Decoded& event) { return event.id == BT_SIM_EVENT_CON_DEVICE_FOUND; });
    steps.expect(found != steps.events().end(), "no device was found");
    return address_of(*found);
}

void connect(Steps& steps, const BtDevAddress& phone)
{
    steps.begin("Connect the first device on profile 0");
    const BtConParameters parameters{kProfile, {}};
    steps.asked("BT_SRV_CON_requestConnection(" + text_of(phone) + ", profile 0)");
    steps.expect(BT_SRV_CON_requestConnection(&phone, &parameters) == BT_OK, "the request was not posted");
    const auto answer = steps.await("CON_requestConnection");
    steps.expect(answer && number_of(*answer, "result") == BT_SIM_OK, "the connection was not made");
    steps.expect(text_of(address_of(*answer)) == text_of(phone), "the answer is about another device");
}

void read_devices(Steps& steps, const BtDevAddress& phone)
{
    steps.begin("Read the registered devices");
    std::vector<BtConRegDevInfo> devices(BT_CON_DEVICE_MAX);
    const int32_t from = 0;
    steps.asked("BT_SRV_CON_getRemoteDeviceList(0, 0, 17)");
    const int32_t count = BT_SRV_CON_getRemoteDeviceList(0, &from, BT_CON_DEVICE_MAX, devices.data());
    bool connected = false;
    for (int32_t i = 0; i < count; ++i) {
        const BtConRegDevInfo& device = devices[static_cast<size_t>(i)];
        const size_t length = std::min<size_t>(device.name.name_length, BT_CON_NAME_TEXT_SIZE);
        const std::string name(device.name.name_text, device.name.name_text + length);
        steps.answered(text_of(device.bd_addr) + " \"" + bt::catalogue::printable(name) + "\"");
        connected = connected || (text_of(device.bd_addr) == text_of(phone) && device.profile[kProfile].connected == 1);
    }
    steps.expect(connected, "the device is not in the list as connected");
}

void read_mode_and_role(Steps& steps, const BtDevAddress& phone)
{
    steps.begin("Read its connection mode and role");
    uint32_t mode = 0, role = 0;
    steps.asked("BT_SRV_CON_getConnectionMode, BT_SRV_CON_getLocalDeviceRole");
    const int32_t mode_result = BT_SRV_CON_getConnectionMode(&phone, &mode);
    const int32_t role_result = BT_SRV_CON_getLocalDeviceRole(&phone, &role);
    steps.answered("mode " + std::to_string(mode) + ", role " + std::to_string(role));
    steps.expect(mode_result == BT_OK && role_result == BT_OK, "a query failed");
}

void ask_for_device_id(Steps& steps, const BtDevAddress& phone)
{
    steps.begin("Ask for its device ID values");
    steps.asked("BT_SRV_CON_queryRemoteDeviceDIDInfo(" + text_of(phone) + ")");
    steps.expect(BT_SRV_CON_queryRemoteDeviceDIDInfo(&phone) == BT_OK, "the request was not posted");
    const auto answer = steps.await("CON_queryRemoteDeviceDIDInfo");
    steps.expect(answer && number_of(*answer, "result") == BT_SIM_OK, "the values were not read");
    steps.expect(number_of(*answer, "count") > 0, "the device has none");

    const auto key = static_cast<uint32_t>(number_of(*answer, "key_1"));
    std::vector<uint8_t> value(BT_CON_DID_VALUE_SIZE);
    steps.asked("BT_SRV_CON_getRemoteDeviceDIDInfo(" + text_of(phone) + ", key " + std::to_string(key) + ")");
    const int32_t result = BT_SRV_CON_getRemoteDeviceDIDInfo(&phone, key, value.data());
    steps.answered("value " + bt::catalogue::hex_text(value));
    steps.expect(result == BT_OK && value == bytes_of(*answer, "value_1"), "the stored value is another one");
}

} // namespace

int main()
{
    const char* const root = std::getenv("BT_SERVICE_ROOT");
    Steps steps(root != nullptr ? root : "");
    std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);

    const uint32_t handle = register_for_events(steps);
    const BtDevAddress phone = search(steps);
    connect(steps, phone);
    read_devices(steps, phone);
    read_mode_and_role(steps, phone);
    ask_for_device_id(steps, phone);

    BT_SRV_EvtSrv_deregist(handle);
    bt_host_release_pno();
    return EXIT_SUCCESS;
}
