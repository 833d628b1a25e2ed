// Queries of a phone: its profiles, one of its services, its device ID values.
#include "sim/connection_link.h"
#include "sim/connection_store.h"

#include "wire/request.h"

#include <algorithm>

namespace bt::sim::con {

namespace {

// The service identifier block is a length word (2, 4 or 16) and that many bytes, most significant first.
bool has_service(const Phone& phone, const std::vector<uint8_t>& block)
{
    if (block.size() != 24) return false;
    const size_t length = std::min<size_t>(block[0], 16);
    const ServiceUuid asked(block.begin() + 4, block.begin() + 4 + static_cast<std::ptrdiff_t>(length));
    return std::find(phone.services.begin(), phone.services.end(), asked) != phone.services.end();
}

std::vector<AnswerField> device_id_fields(const Phone& phone)
{
    std::vector<AnswerField> fields = {{"count", static_cast<int64_t>(phone.device_id.size())}};
    constexpr const char* kKeys[kDeviceIdValues] = {"key_1", "key_2"};
    constexpr const char* kValues[kDeviceIdValues] = {"value_1", "value_2"};
    for (size_t i = 0; i < phone.device_id.size(); ++i) {
        const DeviceIdValue& entry = phone.device_id[i];
        fields.push_back({kKeys[i], int64_t{entry.key}});
        fields.push_back({kValues[i], std::vector<uint8_t>(entry.value.begin(), entry.value.end())});
    }
    return fields;
}

} // namespace

void start_query(const Request& request)
{
    const Phone* const phone = scenario->find(request.address());
    if (phone == nullptr)
        answer(request, BT_SIM_UNKNOWN_DEVICE);
    else
        begin({request, phone, 0, {}}, kQuerying);
}

void enter_querying()
{
    link_timer.start(operation()->phone->connect_ms);
}

void query_done()
{
    const Request& request = operation()->request;
    const Phone& phone = *operation()->phone;
    if (!phone.in_range) {
        finish(BT_SIM_OUT_OF_RANGE);
        return;
    }
    switch (static_cast<bt::Request>(request.id())) {
    case bt::Request::CON_startServiceDiscovery:
        finish(BT_SIM_OK, {{"profiles", int64_t{phone.profiles}}});
        break;
    case bt::Request::CON_startServiceDiscovery_UUID:
        finish(BT_SIM_OK, {{"found", int64_t{has_service(phone, request.bytes("service_id"))}}});
        break;
    default:
        keep_device_id(phone);
        finish(BT_SIM_OK, device_id_fields(phone));
        break;
    }
}

} // namespace bt::sim::con
