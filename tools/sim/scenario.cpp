#include "sim/scenario.h"

#include "sim/json_reader.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <map>

namespace bt::sim {

namespace {

constexpr uint32_t kLongestMs = 600000;
constexpr size_t kMostPhones = 64;

std::optional<std::vector<uint8_t>> parse_hex(const std::string& text)
{
    if (text.size() % 2 != 0 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) return {};
    std::vector<uint8_t> bytes;
    for (size_t i = 0; i < text.size(); i += 2)
        bytes.push_back(static_cast<uint8_t>(std::stoul(text.substr(i, 2), nullptr, 16)));
    return bytes;
}

BtDevAddress read_address(const JsonReader& object, const char* key)
{
    std::string text = object.required_text(key, 17);
    const bool separated = text.size() == 17 && std::count(text.begin(), text.end(), ':') == 5;
    text.erase(std::remove(text.begin(), text.end(), ':'), text.end());
    const auto bytes = parse_hex(text);
    if (!separated || !bytes || bytes->size() != 6)
        object.refuse(key, "is not a device address", "write six bytes as AA:BB:CC:DD:EE:FF");
    if (std::all_of(bytes->begin(), bytes->end(), [](uint8_t byte) { return byte == 0xFF; }))
        object.refuse(key, "means no device", "write an address other than FF:FF:FF:FF:FF:FF");

    BtDevAddress address{};
    std::copy(bytes->begin(), bytes->end(), address.address);
    return address;
}

uint32_t read_device_class(const JsonReader& object)
{
    const std::string text = object.text("device_class", "5A020C", 6);
    const auto bytes = parse_hex(text);
    if (!bytes || bytes->size() != 3)
        object.refuse("device_class", fmt::format("is \"{}\"", text), "write six hex digits such as \"5A020C\"");
    return static_cast<uint32_t>((*bytes)[0] << 16 | (*bytes)[1] << 8 | (*bytes)[2]);
}

std::vector<ServiceUuid> read_services(const JsonReader& object)
{
    std::vector<ServiceUuid> services;
    for (const std::string& text : object.texts("services")) {
        const auto uuid = parse_hex(text);
        if (!uuid || (uuid->size() != 2 && uuid->size() != 4 && uuid->size() != 16))
            object.refuse("services", fmt::format("holds \"{}\"", text), "write UUIDs of 4, 8 or 32 hex digits");
        services.push_back(*uuid);
    }
    return services;
}

std::vector<DeviceIdValue> read_device_id(const JsonReader& phone)
{
    std::vector<DeviceIdValue> values;
    for (const JsonReader& object : phone.objects("device_id", kDeviceIdValues)) {
        object.expect_only({"key", "value"});
        DeviceIdValue entry;
        entry.key = object.number("key", 0, 0, UINT32_MAX);
        if (entry.key == 0) object.refuse("key", "is missing or 0", "write a number from 1 on");
        const auto bytes = parse_hex(object.required_text("value", 16));
        if (!bytes || bytes->size() != entry.value.size())
            object.refuse("value", "is not 8 bytes", "write 16 hex digits");
        std::copy(bytes->begin(), bytes->end(), entry.value.begin());
        values.push_back(entry);
    }
    return values;
}

bool only_digits(const std::string& text)
{
    return !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
}

void read_pairing(const JsonReader& object, Phone& phone)
{
    static const std::map<std::string, Pairing> methods = {{"just_works", Pairing::just_works},
                                                           {"pin", Pairing::pin},
                                                           {"passkey", Pairing::passkey},
                                                           {"numeric", Pairing::numeric},
                                                           {"refuse", Pairing::refuse}};
    const std::string method = object.text("method", "just_works", 32);
    const auto found = methods.find(method);
    if (found == methods.end())
        object.refuse("method", fmt::format("is \"{}\"", method),
                      "use one of: just_works, pin, passkey, numeric, refuse");

    phone.pairing = found->second;
    if (phone.pairing == Pairing::just_works || phone.pairing == Pairing::refuse) object.expect_only({"method"});
    if (phone.pairing == Pairing::numeric) {
        object.expect_only({"method", "value"});
        phone.numeric_value = object.number("value", 123456, 0, 999999);
    }
    if (phone.pairing == Pairing::pin) {
        object.expect_only({"method", "pin"});
        phone.key = object.required_text("pin", 16);
        if (phone.key.empty()) object.refuse("pin", "is empty", "write 1 to 16 characters");
    }
    if (phone.pairing == Pairing::passkey) {
        object.expect_only({"method", "passkey"});
        phone.key = object.required_text("passkey", 6);
        if (!only_digits(phone.key)) object.refuse("passkey", "is not a number", "write up to six digits in quotes");
    }
}

void read_delays(const JsonReader& object, Phone& phone)
{
    object.expect_only({"search_ms", "pair_ms", "connect_ms", "disconnect_ms"});
    phone.search_ms = object.number("search_ms", 500, 0, kLongestMs);
    phone.pair_ms = object.number("pair_ms", 500, 0, kLongestMs);
    phone.connect_ms = object.number("connect_ms", 300, 0, kLongestMs);
    phone.disconnect_ms = object.number("disconnect_ms", 100, 0, kLongestMs);
}

Phone read_phone(const JsonReader& object)
{
    object.expect_only({"address", "name", "device_class", "in_range", "profiles", "services", "pairing", "delays",
                        "device_id", "role", "mode", "transmitting_power", "connects_after_ms", "connects_profile"});
    Phone phone;
    phone.address = read_address(object, "address");
    phone.name = object.required_text("name", kDeviceNameMax);
    phone.device_class = read_device_class(object);
    phone.in_range = object.flag("in_range", true);
    for (const uint32_t number : object.numbers("profiles", 0, kProfileNumberMax))
        phone.profiles |= 1U << number;
    phone.services = read_services(object);
    read_pairing(object.object("pairing"), phone);
    read_delays(object.object("delays"), phone);
    phone.device_id = read_device_id(object);
    phone.role = object.number("role", 0, 0, UINT32_MAX);
    phone.mode = object.number("mode", 1, 0, UINT32_MAX);
    phone.transmitting_power = object.signed_number("transmitting_power", 4, -128, 127);
    if (object.has("connects_after_ms")) phone.connects_after_ms = object.number("connects_after_ms", 0, 0, kLongestMs);
    phone.connects_profile = object.number("connects_profile", 0, 0, kProfileNumberMax);
    return phone;
}

LocalDevice read_local(const JsonReader& object)
{
    object.expect_only({"name", "address", "mode", "reply_timeout_ms"});
    LocalDevice local;
    local.name = object.required_text("name", kDeviceNameMax);
    local.address = read_address(object, "address");
    local.mode = object.number("mode", 0, 0, UINT32_MAX);
    local.reply_timeout_ms = object.number("reply_timeout_ms", 30000, 1, kLongestMs);
    return local;
}

nlohmann::json parse_file(const std::string& file)
{
    std::ifstream stream(file);
    if (!stream)
        throw ScenarioError(
            fmt::format("{}: {}; give a readable scenario file with --scenario", file, strerror(errno)));
    try {
        return nlohmann::json::parse(stream);
    } catch (const nlohmann::json::parse_error& error) {
        throw ScenarioError(fmt::format("{}: is not JSON: {}", file, error.what()));
    }
}

} // namespace

const Phone* Scenario::find(const BtDevAddress& address) const
{
    const auto found = std::find_if(phones.begin(), phones.end(),
                                    [&](const Phone& phone) { return same_address(phone.address, address); });
    return found == phones.end() ? nullptr : &*found;
}

Scenario load_scenario(const std::string& file)
{
    const JsonReader root(parse_file(file), file, "");
    root.expect_only({"$schema", "local", "phones"});

    Scenario scenario;
    scenario.local = read_local(root.object("local"));
    for (const JsonReader& object : root.objects("phones", kMostPhones)) {
        const Phone phone = read_phone(object);
        if (scenario.find(phone.address) != nullptr)
            object.refuse("address", "is the address of an earlier phone", "give each phone its own");
        scenario.phones.push_back(phone);
    }
    return scenario;
}

bool same_address(const BtDevAddress& a, const BtDevAddress& b)
{
    return std::memcmp(a.address, b.address, sizeof a.address) == 0;
}

std::string to_text(const BtDevAddress& address)
{
    const uint8_t* const at = address.address;
    return fmt::format("{:02X}:{:02X}:{:02X}:{:02X}:{:02X}:{:02X}", at[0], at[1], at[2], at[3], at[4], at[5]);
}

} // namespace bt::sim
