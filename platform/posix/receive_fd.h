// The pollable descriptor of the own queue.
#pragma once

#include "ring.h"

namespace bt::platform {

// Called after every message taken: the descriptor stops being readable when none is left.
void settle_receive_fd(Ring& ring);

void close_receive_fd();

void receive_fd_before_fork();
void receive_fd_after_fork_in_parent();
void receive_fd_after_fork_in_child();

} // namespace bt::platform
