// A timer of a state machine, whose expiry arrives as a message like any other.
#pragma once

#include <bt_service/bt_message.h>

namespace bt::sim {

// The low half of the timer id is the cid of the expiry message and selects its handling; the high half counts the
// starts, so that an expiry that was on its way when the timer was stopped or restarted is told apart.
class MachineTimer {
public:
    explicit constexpr MachineTimer(uint16_t cid) : id_(cid) {}

    void start(uint32_t ms);
    void stop();
    // True once for the expiry of the last start.
    bool expired(const BtMessage& message);

private:
    uint32_t id_;
    bool running_ = false;
};

} // namespace bt::sim
