// What happens to the layer when the process forks.
#pragma once

#include <cstdint>

namespace bt::platform {

// Registers the handlers once. Called wherever the layer's state is set up.
void set_up_fork_handlers();

// The process's id, without a system call each time. Right once the handlers are registered.
uint32_t own_pid();

} // namespace bt::platform
