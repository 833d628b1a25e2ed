// Request ids, one name per exported request function, from the catalogue.
#pragma once

#include <cstdint>

namespace bt {

enum class Request : uint16_t {
#define BT_REQUEST(channel, name, id, fields) name = (id),
#include "wire/requests.def"
#undef BT_REQUEST
};

} // namespace bt
