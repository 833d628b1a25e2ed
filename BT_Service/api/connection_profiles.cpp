// Requests to the connection service that connect, accept, give up and disconnect profiles of one remote device.

#include "api/connection_address.h"
#include "api/connection_post.h"

#include <bt_service/bt_connection.h>

using bt::Payload;
using bt::Request;
using bt::con::is_device;
using bt::con::post;

namespace {

constexpr uint32_t kLastProfile = 8;
constexpr uint32_t kUnconnectableProfile = 4;

// The one profile with several instances, told apart by a selector.
constexpr uint32_t kSelectedProfile = 5;
constexpr uint32_t kLastSelector = 26;
constexpr uint32_t kEverySelector = 255;

constexpr uint32_t kConnectionPayload = 40;

// Reads the selector only for the profile that has one; 0, which no check lets pass there, stands for none.
uint32_t selector_for(uint32_t profile, const uint32_t* selector)
{
    return profile == kSelectedProfile && selector != nullptr ? *selector : 0;
}

bool selects(uint32_t profile, uint32_t selector)
{
    return profile != kSelectedProfile || (selector >= 1 && selector <= kLastSelector);
}

bool can_connect(uint32_t profile)
{
    return profile <= kLastProfile && profile != kUnconnectableProfile;
}

int32_t post_profile(Request request, const BtDevAddress& addr, uint32_t profile, uint32_t selector)
{
    return post(request, Payload().address(addr).u32(profile).u32(selector));
}

int32_t post_connection(Request request, Payload& payload)
{
    const int32_t posted = post(request, payload);
    return posted == BT_FAILED ? BT_NOT_POSTED : posted;
}

// Appends those values that the profile takes.
void append_values(Payload& payload, const BtConParameters& parameters)
{
    const uint32_t(&values)[6] = parameters.values;
    switch (parameters.profile) {
    case 3:
        payload.bytes(values, 3 * sizeof *values).u16(values[3]);
        break;
    case 5:
        payload.bytes(values, sizeof values);
        break;
    case 7:
        payload.u32(values[0]);
        break;
    default:
        break;
    }
}

} // namespace

int32_t BT_SRV_CON_requestConnection(const BtDevAddress* addr, const BtConParameters* parameters)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (parameters == nullptr || !can_connect(parameters->profile)) return BT_BAD_ARGUMENT;

    Payload payload;
    payload.address(*addr).u32(parameters->profile);
    append_values(payload, *parameters);
    return post_connection(Request::CON_requestConnection, payload.zeros_to(kConnectionPayload));
}

int32_t BT_SRV_CON_requestConnection_Ex(const BtDevAddress* addr, const BtConParameters* parameters,
                                        const uint32_t* selector)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (parameters == nullptr || !can_connect(parameters->profile)) return BT_BAD_ARGUMENT;
    const uint32_t selected = selector_for(parameters->profile, selector);
    if (!selects(parameters->profile, selected)) return BT_BAD_ARGUMENT;

    return post_connection(Request::CON_requestConnection_Ex,
                           Payload().address(*addr).bytes(parameters, sizeof *parameters).u32(selected));
}

int32_t BT_SRV_CON_acceptConnection(uint32_t first, const BtDevAddress* addr, const BtConProfileFilterBlock* filter)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;

    const bool filtered = filter != nullptr && filter->count > 0;
    return post(Request::CON_acceptConnection, Payload().u32(first).address(*addr).u32(filtered).bytes_or_zeros(
                                                   filtered ? filter : nullptr, sizeof *filter));
}

int32_t BT_SRV_CON_cancelConnection(const BtDevAddress* addr, uint32_t profile)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (profile > kLastProfile) return BT_BAD_ARGUMENT;

    return post_profile(Request::CON_cancelConnection, *addr, profile, 0);
}

int32_t BT_SRV_CON_cancelConnection_Ex(const BtDevAddress* addr, uint32_t profile, const uint32_t* selector)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (profile > kLastProfile) return BT_BAD_ARGUMENT;
    const uint32_t selected = selector_for(profile, selector);
    if (!selects(profile, selected)) return BT_BAD_ARGUMENT;

    return post_profile(Request::CON_cancelConnection_Ex, *addr, profile, selected);
}

int32_t BT_SRV_CON_requestDisconnection(const BtDevAddress* addr, uint32_t profile)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (profile > kLastProfile) return BT_BAD_ARGUMENT;

    return post_profile(Request::CON_requestDisconnection, *addr, profile, 0);
}

int32_t BT_SRV_CON_requestDisconnection_Ex(const BtDevAddress* addr, uint32_t profile, const uint32_t* selector)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (profile > kLastProfile) return BT_BAD_ARGUMENT;
    const uint32_t selected = selector_for(profile, selector);
    if (!selects(profile, selected) && selected != kEverySelector) return BT_BAD_ARGUMENT;

    return post_profile(Request::CON_requestDisconnection_Ex, *addr, profile, selected);
}
