// The machines of the connection service: their states, and what each does with a message. connection_tables.cpp says
// which function runs in which state.
#pragma once

#include "sim/machine_timer.h"
#include "sim/request.h"
#include "sim/scenario.h"

#include <cstdint>

namespace bt::sim::con {

enum Machine : uint32_t { kSettingsMachine = 1, kSearchMachine, kIncomingMachine, kLinkMachine };

enum State : uint32_t {
    kServing = 1,

    kSearchIdle = 10,
    kSearching,

    kNobodyAsks = 20,
    kPhoneAsks,

    kLinkIdle = 30,
    kLinkBusy, // around all that follow
    kRegistering, // around the next two
    kPairing,
    kPrompting,
    kConnecting,
    kReleasing,
    kQuerying
};

// Far from every request id.
enum TimerCid : uint16_t { kSearchTimer = 0xE001, kIncomingTimer = 0xE002, kLinkTimer = 0xE003 };

extern const Scenario* scenario;

// Settings: one state, in which every message is answered at once.
uint32_t settings_state();
void keep_setting(const Request& request);
void tell_transmitting_power(const Request& request);
// The settings as they are when the unit has just been switched on.
void set_initial_settings();

// Search.
extern MachineTimer search_timer;
uint32_t search_state();
void start_search(const Request& request);
void refuse_second_search(const Request& request);
void cancel_search(const Request& request);
void phone_found();

// Incoming connections, which the phones ask for by themselves.
extern MachineTimer incoming_timer;
uint32_t incoming_state();
void start_incoming();
void phone_asks();
void accept_connection(const Request& request);
void cancel_remote_connection(const Request& request);

// Link: one request after the other; those that come while it is busy wait.
extern MachineTimer link_timer;
uint32_t link_state();
bool link_is_idle();
// Handles the requests that waited, as far as the link is idle.
void take_deferred();
uint32_t defer_request(void* message);
void request_connection(const Request& request);
void request_disconnection(const Request& request);
void request_all_disconnection(const Request& request);
void delete_device(const Request& request);
void start_query(const Request& request);
void cancel_connection(const Request& request);
void cancel_registration(const Request& request);
void authenticate(const Request& request);
void pairing_done();
void prompt_timed_out();
void connecting_done();
void releasing_done();
void query_done();

// What no machine waits for in its present state.
void not_expected(const Request& request);

} // namespace bt::sim::con
