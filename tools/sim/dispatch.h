// Hands an event of this service process to event dispatch.
#pragma once

#include "wire/payload.h"

namespace bt::sim {

void dispatch(uint16_t event_id, Payload& payload);

} // namespace bt::sim
