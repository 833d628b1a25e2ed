#include "sim/machine_timer.h"

#include <bt_service/bt_timer.h>

#include <algorithm>
#include <cstring>

namespace bt::sim {

void MachineTimer::start(uint32_t ms)
{
    stop();
    id_ += 0x10000;
    running_ = true;
    BT_CMN_startTimer(id_, std::max(ms, 1U));
}

void MachineTimer::stop()
{
    if (!running_) return;
    running_ = false;
    BT_CMN_stopTimer(id_);
}

bool MachineTimer::expired(const BtMessage& message)
{
    uint32_t id = 0;
    if (message.msg_header.hdr.len != sizeof id) return false;
    std::memcpy(&id, message.payload, sizeof id);
    if (!running_ || id != id_) return false;
    running_ = false;
    return true;
}

} // namespace bt::sim
