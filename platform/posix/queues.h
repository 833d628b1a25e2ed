// Which ring belongs to which process number.
#pragma once

#include "domain.h"
#include "ring.h"

namespace bt::platform {

// The ring of a process number; null with `*result` 1 (no such queue) or -1. Any thread; one table look-up once known.
Ring* find_queue(uint32_t pno, int32_t* result);

// The ring for its owner, made when there is none yet; null with an error text. The caller holds the process lock.
Ring* obtain_queue(DomainArea& area, uint32_t pno);

// Forgets the rings of a domain that is gone. Their mappings stay, since other threads may be inside them.
void forget_queues();

} // namespace bt::platform
