// The process number that the calling process owns, and its queue.
#pragma once

#include "ring.h"

namespace bt::platform {

// 0 when none. Claims the number of BT_PLATFORM_PNO at first use.
uint32_t own_number();

// The own queue; null when no number is owned. Does not claim.
Ring* own_ring();

// Takes a message from the own queue, if it is still `ring`.
bool take_own(Ring& ring, void* buffer, uint32_t size);

// Process that holds a number, 0 when none lives. For holders of the process lock.
uint32_t owner_of(uint32_t pno);

// What depends on the number ends with it: timers, the pollable descriptor. For holders of the process lock, when the
// domain is gone.
void forget_number();

void number_before_fork();
void number_after_fork_in_parent();
void number_after_fork_in_child();

} // namespace bt::platform
