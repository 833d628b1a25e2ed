// The listener table in shared memory and the named lock that guards it, as both sides of event distribution use them.
#pragma once

#include <bt_service/bt_events.h>

#include <atomic>

namespace bt::eds {

// One side's handle of the named lock, kept for the life of the process.
class TableLock {
public:
    // Creates the lock unless this process has it already. False when that fails.
    bool create();
    // Takes the lock. A failed attempt has unlocked once already: the platform may have given the lock all the same.
    bool take();
    bool release();

private:
    std::atomic<uint32_t> handle_{0};
};

// Links the table into the process; null when there is none, or one that is too small.
BtEvtListenerTable* link_table();

} // namespace bt::eds
