// Posts a request to the connection service.
#pragma once

#include "wire/payload.h"
#include "wire/request.h"

namespace bt::con {

// Frames the payload and hands it to the connection sender. Returns 0, or -1 when the message could not be posted.
int32_t post(Request request, Payload& payload);
int32_t post(Request request);

} // namespace bt::con
