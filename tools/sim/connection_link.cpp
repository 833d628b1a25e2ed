// The link machine's frame: one operation at a time, and the requests that wait for their turn.
#include "sim/connection_link.h"

#include "sim/connection_tables.h"
#include "sim/dispatch.h"

#include <bt_service/bt_event_queue.h>

#include <utility>

namespace bt::sim::con {

MachineTimer link_timer(kLinkTimer);

namespace {

constexpr int kMostDeferred = 32;

uint32_t state = kLinkIdle;
std::optional<Operation> current;

BtQueueNode deferred = {{}, &deferred};
int deferred_count = 0;

} // namespace

uint32_t link_state()
{
    return state;
}

bool link_is_idle()
{
    return state == kLinkIdle;
}

const Operation* operation()
{
    return current ? &*current : nullptr;
}

void move_to(State next)
{
    BT_CMN_changeStatus(&state, next, link_states());
}

void begin(Operation started, State next)
{
    current.emplace(std::move(started));
    move_to(next);
}

void finish(BtSimResult result, const std::vector<AnswerField>& fields)
{
    const Request request = current->request;
    move_to(kLinkIdle);
    current.reset();
    answer(request, result, fields);
}

void leave_busy()
{
    link_timer.stop();
}

void tell_change(uint16_t event, const BtDevAddress& address, uint32_t profile)
{
    Payload payload;
    payload.address(address).u32(profile);
    dispatch(event, payload);
}

uint32_t defer_request(void* message)
{
    if (deferred_count < kMostDeferred && BT_CMN_enqueueMsg(message, &deferred) == 0)
        ++deferred_count;
    else
        answer(Request(*static_cast<const BtMessage*>(message)), BT_SIM_BUSY);
    return 0;
}

void take_deferred()
{
    BtMessage message;
    while (link_is_idle() && deferred_count > 0 && BT_CMN_queueMsg(&message, &deferred) == 1) {
        --deferred_count;
        BT_CMN_doMtxFunc(&message, dispatch_table(), machine_table());
    }
}

} // namespace bt::sim::con
