// Search: the phones in range are reported one after the other, each after its own delay.
#include "sim/connection_machines.h"
#include "sim/connection_store.h"
#include "sim/connection_tables.h"
#include "sim/dispatch.h"

#include <algorithm>
#include <optional>

namespace bt::sim::con {

MachineTimer search_timer(kSearchTimer);

namespace {

struct Search {
    std::optional<Request> request;
    std::vector<const Phone*> phones; // in the order in which they answer
    size_t found = 0;
};

uint32_t state = kSearchIdle;
Search search;

void finish_search(BtSimResult result)
{
    search_timer.stop();
    BT_CMN_changeStatus(&state, kSearchIdle, search_states());
    answer(*search.request, result, {{"count", static_cast<int64_t>(search.found)}});
    search = {};
}

void wait_for_next_phone()
{
    if (search.found == search.phones.size()) {
        finish_search(BT_SIM_OK);
        return;
    }
    const uint32_t answered = search.found == 0 ? 0 : search.phones[search.found - 1]->search_ms;
    search_timer.start(search.phones[search.found]->search_ms - answered);
}

} // namespace

uint32_t search_state()
{
    return state;
}

void start_search(const Request& request)
{
    search.request.emplace(request);
    for (const Phone& phone : scenario->phones)
        if (phone.in_range) search.phones.push_back(&phone);
    std::stable_sort(search.phones.begin(), search.phones.end(),
                     [](const Phone* a, const Phone* b) { return a->search_ms < b->search_ms; });
    clear_found();
    BT_CMN_changeStatus(&state, kSearching, search_states());
    wait_for_next_phone();
}

void refuse_second_search(const Request& request)
{
    answer(request, BT_SIM_BUSY);
}

void cancel_search(const Request& request)
{
    finish_search(BT_SIM_CANCELLED);
    answer(request, BT_SIM_OK);
}

void phone_found()
{
    const Phone& phone = *search.phones[search.found++];
    add_found(phone);
    Payload payload;
    payload.address(phone.address)
        .u32(phone.device_class)
        .u32(static_cast<uint32_t>(phone.name.size()))
        .bytes(phone.name.data(), static_cast<uint32_t>(phone.name.size()));
    dispatch(BT_SIM_EVENT_CON_DEVICE_FOUND, payload);
    wait_for_next_phone();
}

} // namespace bt::sim::con
