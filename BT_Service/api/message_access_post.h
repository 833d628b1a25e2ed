// Posts a request to the message access service.
#pragma once

#include "wire/payload.h"
#include "wire/request.h"

namespace bt::map {

int32_t post(Request request);
// A payload longer than 1,006 bytes is cut.
int32_t post(Request request, Payload& payload);

} // namespace bt::map
