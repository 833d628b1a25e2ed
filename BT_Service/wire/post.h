// Posts a request to the service process that handles its profile.
#pragma once

#include "wire/payload.h"
#include "wire/request.h"

namespace bt {

// Posts header and payload to `channel` without waiting.
// Returns 0; -1 for a refused payload; -127 when the message layer is unusable; any other code is the platform's.
int32_t post(BtProcessNumber channel, Request request, Payload& payload);

// Posts a request without payload.
int32_t post(BtProcessNumber channel, Request request);

} // namespace bt
