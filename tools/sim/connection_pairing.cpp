// Pairing and connecting: the way from a request, or an accepted phone, to a connected profile.
#include "sim/connection_link.h"
#include "sim/connection_store.h"
#include "sim/dispatch.h"

#include "wire/request.h"

#include <algorithm>

namespace bt::sim::con {

namespace {

// How a phone that does not pair by itself asks, and which request answers it.
struct Prompt {
    Pairing pairing;
    uint16_t event;
    bt::Request reply;
};

constexpr Prompt kPrompts[] = {
    {Pairing::pin, BT_SIM_EVENT_CON_PIN_REQUEST, bt::Request::CON_authenticatePinCode},
    {Pairing::numeric, BT_SIM_EVENT_CON_NUMERIC_REQUEST, bt::Request::CON_authenticateNumericValue},
    {Pairing::passkey, BT_SIM_EVENT_CON_PASSKEY_REQUEST, bt::Request::CON_authenticatePasskey},
};

const Phone& phone()
{
    return *operation()->phone;
}

const Prompt& prompt()
{
    return *std::find_if(std::begin(kPrompts), std::end(kPrompts),
                         [](const Prompt& candidate) { return candidate.pairing == phone().pairing; });
}

// The PIN block is a length word and 16 characters, the passkey block up to 8 digits that a zero byte may end.
std::string key_in(const Request& reply)
{
    std::vector<uint8_t> block = reply.bytes("passkey");
    if (const std::vector<uint8_t> pin = reply.bytes("pin"); pin.size() == 20) {
        const size_t length = std::min<size_t>(pin[0], 16);
        block.assign(pin.begin() + 4, pin.begin() + 4 + static_cast<std::ptrdiff_t>(length));
    }
    return {block.begin(), std::find(block.begin(), block.end(), uint8_t{0})};
}

void register_and_connect()
{
    const BtSimResult registered_as = register_phone(phone());
    if (registered_as != BT_SIM_OK) {
        finish(registered_as);
        return;
    }
    Payload payload;
    payload.address(phone().address);
    dispatch(BT_SIM_EVENT_CON_REGISTERED, payload);
    move_to(kConnecting);
}

} // namespace

void begin_connection(const Request& request, const BtDevAddress& address, uint32_t profile)
{
    const Phone* const found = scenario->find(address);
    const std::vector<AnswerField> fields = {{"profile", int64_t{profile}}};
    if (found == nullptr)
        answer(request, BT_SIM_UNKNOWN_DEVICE, fields);
    else if (is_connected(address, profile))
        answer(request, BT_SIM_ALREADY_CONNECTED, fields);
    else
        begin({request, found, profile, {}}, registered(address) ? kConnecting : kPairing);
}

void request_connection(const Request& request)
{
    const uint32_t profile = request.number("profile");
    if (profile > kProfileNumberMax)
        answer(request, BT_SIM_MALFORMED);
    else
        begin_connection(request, request.address(), profile);
}

void enter_pairing()
{
    link_timer.start(phone().pair_ms);
}

void pairing_done()
{
    if (!phone().in_range)
        finish(BT_SIM_OUT_OF_RANGE);
    else if (phone().pairing == Pairing::refuse)
        finish(BT_SIM_REFUSED);
    else if (phone().pairing == Pairing::just_works)
        register_and_connect();
    else
        move_to(kPrompting);
}

void enter_prompting()
{
    link_timer.start(scenario->local.reply_timeout_ms);
    Payload payload;
    payload.address(phone().address);
    if (phone().pairing == Pairing::numeric) payload.u32(phone().numeric_value);
    dispatch(prompt().event, payload);
}

void prompt_timed_out()
{
    finish(BT_SIM_AUTHENTICATION_FAILED);
}

void authenticate(const Request& reply)
{
    if (reply.id() != static_cast<uint16_t>(prompt().reply) || !same_address(reply.address(), phone().address)) {
        answer(reply, BT_SIM_NOT_EXPECTED);
        return;
    }
    const bool agreed = reply.number("reply") == 0;
    const bool right = phone().pairing == Pairing::numeric || key_in(reply) == phone().key;
    if (!agreed) {
        answer(reply, BT_SIM_OK);
        finish(BT_SIM_REFUSED);
    } else if (!right) {
        answer(reply, BT_SIM_AUTHENTICATION_FAILED);
        finish(BT_SIM_AUTHENTICATION_FAILED);
    } else {
        answer(reply, BT_SIM_OK);
        register_and_connect();
    }
}

void enter_connecting()
{
    link_timer.start(phone().connect_ms);
}

void connecting_done()
{
    const uint32_t profile = operation()->profile;
    BtSimResult result = BT_SIM_OK;
    if (!phone().in_range)
        result = BT_SIM_OUT_OF_RANGE;
    else if (!phone().has_profile(profile))
        result = BT_SIM_NOT_SUPPORTED;
    else
        result = connect(phone(), profile);
    if (result == BT_SIM_OK) tell_change(BT_SIM_EVENT_CON_CONNECTED, phone().address, profile);
    finish(result, {{"profile", int64_t{profile}}});
}

void cancel_connection(const Request& request)
{
    const bool same =
        same_address(request.address(), phone().address) && request.number("profile") == operation()->profile;
    answer(request, same ? BT_SIM_OK : BT_SIM_NOT_EXPECTED);
    if (same) finish(BT_SIM_CANCELLED);
}

void cancel_registration(const Request& request)
{
    answer(request, BT_SIM_OK);
    finish(BT_SIM_CANCELLED);
}

} // namespace bt::sim::con
