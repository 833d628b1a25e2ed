// The timers of the process.
#pragma once

namespace bt::platform {

// Stops all of them.
void cancel_timers();

void timers_before_fork();
void timers_after_fork_in_parent();
void timers_after_fork_in_child();

} // namespace bt::platform
