// Releasing: disconnecting one profile, all of a device or all of all devices, and forgetting a device.
#include "sim/connection_link.h"
#include "sim/connection_store.h"
#include "sim/dispatch.h"

#include "wire/request.h"

#include <algorithm>

namespace bt::sim::con {

namespace {

std::vector<Link> links_of(const BtDevAddress& address)
{
    std::vector<Link> links;
    for (const uint32_t profile : connected_profiles(address))
        links.push_back({address, profile});
    return links;
}

void begin_release(const Request& request, std::vector<Link> links)
{
    begin({request, scenario->find(request.address()), request.number("profile"), std::move(links)}, kReleasing);
}

bool is_delete(const Request& request)
{
    return request.id() == static_cast<uint16_t>(bt::Request::CON_delete);
}

} // namespace

void request_disconnection(const Request& request)
{
    const uint32_t profile = request.number("profile");
    if (profile > kProfileNumberMax)
        answer(request, BT_SIM_MALFORMED);
    else if (!registered(request.address()))
        answer(request, BT_SIM_NOT_REGISTERED);
    else if (!is_connected(request.address(), profile))
        answer(request, BT_SIM_NOT_CONNECTED);
    else
        begin_release(request, {{request.address(), profile}});
}

void request_all_disconnection(const Request& request)
{
    std::vector<Link> links;
    if (request.number("flag") == 0) {
        if (!registered(request.address())) {
            answer(request, BT_SIM_NOT_REGISTERED);
            return;
        }
        links = links_of(request.address());
    } else {
        for (const BtDevAddress& address : registered_devices())
            for (const Link& link : links_of(address))
                links.push_back(link);
    }
    begin_release(request, std::move(links));
}

void delete_device(const Request& request)
{
    if (!registered(request.address()))
        answer(request, BT_SIM_NOT_REGISTERED);
    else
        begin_release(request, links_of(request.address()));
}

// The slowest of the phones counts; a device that has nothing connected takes no time.
void enter_releasing()
{
    uint32_t longest_ms = 0;
    for (const Link& link : operation()->releases)
        if (const Phone* const phone = scenario->find(link.address))
            longest_ms = std::max(longest_ms, phone->disconnect_ms);
    link_timer.start(longest_ms);
}

void releasing_done()
{
    int64_t count = 0;
    BtSimResult result = BT_SIM_OK;
    for (const Link& link : operation()->releases) {
        const BtSimResult released = disconnect(link.address, link.profile);
        if (released != BT_SIM_OK) {
            result = released;
            continue;
        }
        ++count;
        Payload payload;
        payload.address(link.address).u32(link.profile).u32(BT_SIM_OK);
        dispatch(BT_SIM_EVENT_CON_DISCONNECTED, payload);
    }
    if (is_delete(operation()->request)) result = forget(operation()->request.address());
    finish(result, {{"count", count}});
}

} // namespace bt::sim::con
