#include "sim/dispatch.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_events.h>

namespace bt::sim {

void dispatch(uint16_t event_id, Payload& payload)
{
    payload.sent_by(static_cast<uint16_t>(_sys_GetPno()));
    BT_EDS_dispatch(0, &payload.framed(event_id, 0));
}

} // namespace bt::sim
