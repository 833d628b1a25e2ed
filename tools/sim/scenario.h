// What the simulated unit plays: its own radio and the phones around it, read from a JSON file.
#pragma once

#include <bt_service/bt_types.h>

#include <array>
#include <optional>
#include <string>
#include <vector>

namespace bt::sim {

constexpr uint32_t kProfileNumberMax = 8;
constexpr size_t kDeviceNameMax = 248;
constexpr size_t kDeviceIdValues = 2;

enum class Pairing { just_works, pin, passkey, numeric, refuse };

struct DeviceIdValue {
    uint32_t key = 0;
    std::array<uint8_t, 8> value{};
};

// A service's UUID as its 2, 4 or 16 bytes, most significant first.
using ServiceUuid = std::vector<uint8_t>;

struct Phone {
    BtDevAddress address{};
    std::string name;
    uint32_t device_class = 0;
    bool in_range = true;
    uint32_t profiles = 0; // bit n: the phone has profile number n
    std::vector<ServiceUuid> services;

    Pairing pairing = Pairing::just_works;
    std::string key; // the PIN or passkey that the phone expects
    uint32_t numeric_value = 0; // the number that both sides show

    uint32_t search_ms = 0;
    uint32_t pair_ms = 0;
    uint32_t connect_ms = 0;
    uint32_t disconnect_ms = 0;

    std::vector<DeviceIdValue> device_id;
    uint32_t role = 0;
    uint32_t mode = 0;
    int32_t transmitting_power = 0; // dBm

    std::optional<uint32_t> connects_after_ms; // the phone asks for a connection by itself, counted from the start
    uint32_t connects_profile = 0;

    bool has_profile(uint32_t number) const { return number <= kProfileNumberMax && (profiles >> number & 1U) != 0; }
};

struct LocalDevice {
    std::string name;
    BtDevAddress address{};
    uint32_t mode = 0; // discoverable mode at the start
    uint32_t reply_timeout_ms = 0; // how long a pairing prompt waits for its answer
};

struct Scenario {
    LocalDevice local;
    std::vector<Phone> phones;

    const Phone* find(const BtDevAddress& address) const;
};

// Throws ScenarioError, whose text names the file, the place, what is wrong and the remedy.
Scenario load_scenario(const std::string& file);

bool same_address(const BtDevAddress& a, const BtDevAddress& b);
std::string to_text(const BtDevAddress& address);

} // namespace bt::sim
