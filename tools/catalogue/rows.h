// The catalogue: every request of the interface and every event of the simulated unit, found by id or name.
#pragma once

#include "catalogue/layout.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace bt::catalogue {

enum class Kind { request, event };

struct Row {
    Kind kind;
    std::string name; // requests: the exported function; events: as in bt_sim/events.h
    uint16_t id;
    uint16_t process; // requests: process number they are posted to; events: the one that reports them
    Layout layout;
};

// In catalogue order. Rows of requests that share an id stand together; the first one decodes.
const std::vector<Row>& requests();

// The listed events, then one plain answer (a result word) for each request whose answer is not listed.
const std::vector<Row>& events();

// The row that decodes messages of this id; null for an id of no catalogue.
const Row* find(uint16_t id);

// By name, with or without its "BT_SRV_" or "BT_SIM_EVENT_"; null when there is none.
const Row* find_request(std::string_view name);
const Row* find_event(std::string_view name);

// The event that answers a request.
uint16_t answer_to(uint16_t request_id);

} // namespace bt::catalogue
