// Fills the tables of the library's state machine engine from rules that name several states at once.
#pragma once

#include "sim/machine_timer.h"
#include "sim/request.h"

#include <bt_service/bt_state_machine.h>

#include <initializer_list>
#include <vector>

namespace bt::sim {

// In each of the states, each of the messages runs the action.
struct Rule {
    std::vector<uint32_t> states;
    std::vector<uint32_t> cids;
    BtAction action;
};

// The matrix of a machine, its end row included.
std::vector<BtMatrixRow> matrix_of(std::initializer_list<Rule> rules);

// A row for every message of the matrix, so that it reaches the machine; without an end row.
std::vector<BtDispatchRow> dispatch_of(const std::vector<BtMatrixRow>& matrix, uint32_t machine);

// Actions for the engine around plain functions: a request that is not complete is answered at once, and an expiry that
// is out of date is dropped.
template <void (*Handle)(const Request&)>
uint32_t on_request(void* message)
{
    const Request request(*static_cast<const BtMessage*>(message));
    if (request.complete())
        Handle(request);
    else
        answer(request, BT_SIM_MALFORMED);
    return 0;
}

template <MachineTimer& Timer, void (*Handle)()>
uint32_t on_timer(void* message)
{
    if (Timer.expired(*static_cast<const BtMessage*>(message))) Handle();
    return 0;
}

} // namespace bt::sim
