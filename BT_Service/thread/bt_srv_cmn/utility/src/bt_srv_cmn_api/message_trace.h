// The line that every message sent, received or taken from an event queue leaves.
#pragma once

namespace bt::cmn {

// Traces a BtMessage at the platform logger, on the console and in the log file, as far as each is switched on.
void trace_message(const void* message);

} // namespace bt::cmn
