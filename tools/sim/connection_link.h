// What the link machine has under way; shared by the files that carry out its operations.
#pragma once

#include "sim/connection_machines.h"

#include <optional>
#include <vector>

namespace bt::sim::con {

// One profile of one device.
struct Link {
    BtDevAddress address;
    uint32_t profile;
};

struct Operation {
    Request request; // the one to be answered in the end
    const Phone* phone; // null when the scenario does not know the device
    uint32_t profile;
    std::vector<Link> releases; // what is to be disconnected
};

// Null while the link is idle.
const Operation* operation();

// Starts an operation in a state of the link; the link must be idle.
void begin(Operation started, State state);
void move_to(State state);
// Ends the operation and answers its request.
void finish(BtSimResult result, const std::vector<AnswerField>& fields = {});

// Pairs first when the phone is not registered. Refuses with an answer what cannot work.
void begin_connection(const Request& request, const BtDevAddress& address, uint32_t profile);

void tell_change(uint16_t event, const BtDevAddress& address, uint32_t profile);

// Entry and exit functions of the link's states.
void leave_busy();
void enter_pairing();
void enter_prompting();
void enter_connecting();
void enter_releasing();
void enter_querying();

} // namespace bt::sim::con
