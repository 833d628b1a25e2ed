// Incoming connections: phones that ask by themselves, and the application's word on them.
#include "sim/connection_link.h"
#include "sim/connection_store.h"
#include "sim/connection_tables.h"

#include <bt_service/bt_connection_store.h>

#include <algorithm>

namespace bt::sim::con {

MachineTimer incoming_timer(kIncomingTimer);

namespace {

uint32_t state = kNobodyAsks;
std::vector<const Phone*> phones; // in the order in which they ask
size_t asked = 0;
const Phone* asking = nullptr; // while a phone waits for the application's word

void wait_for_next_phone()
{
    if (asked == phones.size()) return;
    const uint32_t before = asked == 0 ? 0 : *phones[asked - 1]->connects_after_ms;
    incoming_timer.start(*phones[asked]->connects_after_ms - before);
}

// A filter that is not present lets everything in.
bool filter_admits(const Request& request, uint32_t profile)
{
    if (request.number("filter_present") == 0) return true;
    const std::optional<uint32_t> index = profile_index(profile);
    struct {
        BtConProfileFilter head;
        uint32_t indexes[8];
    } filter{};
    const std::vector<uint32_t> words = request.numbers("filter");
    filter.head.count = std::clamp<int32_t>(static_cast<int32_t>(words[0]), 0, std::size(filter.indexes));
    std::copy_n(words.begin() + 1, std::size(filter.indexes), filter.indexes);
    return index && bt_con_IsCheckProfileFilter(&filter.head, *index) == 1;
}

void nobody_asks_any_more()
{
    asking = nullptr;
    BT_CMN_changeStatus(&state, kNobodyAsks, incoming_states());
}

} // namespace

uint32_t incoming_state()
{
    return state;
}

void start_incoming()
{
    for (const Phone& phone : scenario->phones)
        if (phone.in_range && phone.connects_after_ms) phones.push_back(&phone);
    std::stable_sort(phones.begin(), phones.end(),
                     [](const Phone* a, const Phone* b) { return *a->connects_after_ms < *b->connects_after_ms; });
    wait_for_next_phone();
}

// A phone that asks while another one still waits for its word takes the other one's place.
void phone_asks()
{
    const Phone& phone = *phones[asked++];
    if (!is_connected(phone.address, phone.connects_profile)) {
        asking = &phone;
        if (state == kNobodyAsks) BT_CMN_changeStatus(&state, kPhoneAsks, incoming_states());
        tell_change(BT_SIM_EVENT_CON_CONNECTION_INDICATION, phone.address, phone.connects_profile);
    }
    wait_for_next_phone();
}

void accept_connection(const Request& request)
{
    const Phone& phone = *asking;
    if (!same_address(request.address(), phone.address)) {
        answer(request, BT_SIM_NOT_EXPECTED);
        return;
    }
    nobody_asks_any_more();
    const bool accepted = request.number("first") == 0 && filter_admits(request, phone.connects_profile);
    if (!accepted)
        answer(request, BT_SIM_REFUSED, {{"profile", int64_t{phone.connects_profile}}});
    else if (!link_is_idle())
        answer(request, BT_SIM_BUSY, {{"profile", int64_t{phone.connects_profile}}});
    else
        begin_connection(request, phone.address, phone.connects_profile);
}

void cancel_remote_connection(const Request& request)
{
    if (!same_address(request.address(), asking->address)) {
        answer(request, BT_SIM_NOT_EXPECTED);
        return;
    }
    nobody_asks_any_more();
    answer(request, BT_SIM_OK);
}

} // namespace bt::sim::con
