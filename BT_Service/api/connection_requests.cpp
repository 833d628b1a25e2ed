// Requests to the connection service about one remote device: pairing, authentication, service discovery.

#include "api/connection_address.h"
#include "api/connection_post.h"

#include <bt_service/bt_connection.h>

using bt::Payload;
using bt::Request;
using bt::con::is_device;
using bt::con::post;

namespace {

// The reply to an authentication question that carries the key; any other reply carries zeros instead.
constexpr uint32_t kReplyWithKey = 0;

int32_t post_device(Request request, const BtDevAddress* addr)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;

    return post(request, Payload().address(*addr));
}

int32_t post_any_address(Request request, const BtDevAddress* addr)
{
    if (addr == nullptr) return BT_BAD_ARGUMENT;

    return post(request, Payload().address(*addr));
}

template <class Key>
int32_t post_key(Request request, uint32_t reply, const BtDevAddress* addr, const Key* key)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (reply == kReplyWithKey && key == nullptr) return BT_BAD_ARGUMENT;

    const Key* const sent = reply == kReplyWithKey ? key : nullptr;
    return post(request, Payload().u32(reply).address(*addr).bytes_or_zeros(sent, sizeof *key));
}

} // namespace

int32_t BT_SRV_CON_delete(const BtDevAddress* addr)
{
    return post_any_address(Request::CON_delete, addr);
}

int32_t BT_SRV_CON_queryRemoteDeviceDIDInfo(const BtDevAddress* addr)
{
    return post_any_address(Request::CON_queryRemoteDeviceDIDInfo, addr);
}

int32_t BT_SRV_CON_startServiceDiscovery(const BtDevAddress* addr)
{
    return post_device(Request::CON_startServiceDiscovery, addr);
}

int32_t BT_SRV_CON_cancelRemoteDeviceConnection(const BtDevAddress* addr)
{
    return post_device(Request::CON_cancelRemoteDeviceConnection, addr);
}

int32_t BT_SRV_CON_getTransmittingPower(const BtDevAddress* addr)
{
    return post_device(Request::CON_getTransmittingPower, addr);
}

int32_t BT_SRV_CON_startServiceDiscovery_UUID(const BtDevAddress* addr, const BtConServiceId* service_id)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;
    if (service_id == nullptr) return BT_BAD_ARGUMENT;

    return post(Request::CON_startServiceDiscovery_UUID,
                Payload().address(*addr).bytes(service_id, sizeof *service_id));
}

int32_t BT_SRV_CON_authenticateNumericValue(uint32_t reply, const BtDevAddress* addr)
{
    if (!is_device(addr)) return BT_BAD_ARGUMENT;

    return post(Request::CON_authenticateNumericValue, Payload().u32(reply).address(*addr));
}

int32_t BT_SRV_CON_authenticatePasskey(uint32_t reply, const BtDevAddress* addr, const BtConPasskey* passkey)
{
    return post_key(Request::CON_authenticatePasskey, reply, addr, passkey);
}

int32_t BT_SRV_CON_authenticatePinCode(uint32_t reply, const BtDevAddress* addr, const BtConPinCode* pin)
{
    return post_key(Request::CON_authenticatePinCode, reply, addr, pin);
}

int32_t BT_SRV_CON_requestAllDisconnection(uint32_t flag, const BtDevAddress* addr)
{
    const bool of_one_device = flag == 0;
    if (addr == nullptr) return BT_BAD_ARGUMENT;
    if (of_one_device && !is_device(addr)) return BT_BAD_ARGUMENT;

    return post(Request::CON_requestAllDisconnection, Payload().u32(flag).address(*addr));
}

int32_t BT_SRV_CON_permitProfileConnection(uint32_t first, const BtDevAddress* addr, uint32_t second)
{
    if (addr == nullptr) return BT_BAD_ARGUMENT;

    return post(Request::CON_permitProfileConnection, Payload().u32(first).address(*addr).u32(second));
}
