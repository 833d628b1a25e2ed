#include "catalogue/results.h"

#include <bt_sim/events.h>

namespace bt::catalogue {
namespace {

struct ResultText {
    uint32_t result;
    const char* text;
};

constexpr ResultText kResults[] = {
    {BT_SIM_OK, "done"},
    {BT_SIM_MALFORMED, "malformed request"},
    {BT_SIM_UNKNOWN_DEVICE, "unknown device"},
    {BT_SIM_OUT_OF_RANGE, "device out of range"},
    {BT_SIM_BUSY, "busy"},
    {BT_SIM_NOT_REGISTERED, "device not registered"},
    {BT_SIM_NOT_SUPPORTED, "not supported by the device"},
    {BT_SIM_REFUSED, "refused"},
    {BT_SIM_AUTHENTICATION_FAILED, "authentication failed"},
    {BT_SIM_CANCELLED, "cancelled"},
    {BT_SIM_NOT_CONNECTED, "not connected"},
    {BT_SIM_ALREADY_CONNECTED, "already connected"},
    {BT_SIM_LIST_FULL, "device list full"},
    {BT_SIM_NOT_EXPECTED, "nothing waited for it"},
    {BT_SIM_STORE_FAILED, "connection data not stored"},
    {BT_SIM_LINK_LOST, "link lost"},
};

} // namespace

const char* result_text(uint32_t result)
{
    for (const ResultText& known : kResults)
        if (known.result == result) return known.text;
    return "unknown result";
}

} // namespace bt::catalogue
