// The header of a message in a buffer of any alignment.
#pragma once

#include <bt_service/bt_message.h>

#include <cstring>

namespace bt::cmn {

inline BtMessageHeaderFields header_of(const void* message)
{
    BtMessageHeaderFields header;
    std::memcpy(&header, message, sizeof header);
    return header;
}

} // namespace bt::cmn
