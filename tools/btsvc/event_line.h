// An event as a line of output.
#pragma once

#include "btsvc/output.h"

#include <bt_service/bt_message.h>

namespace bt::client {

void print_event(const BtMessage& event, Output& output);

} // namespace bt::client
