// What `btsvc call` can call: one row per exported request or query.
#pragma once

#include "btsvc/arguments.h"

#include <nlohmann/json.hpp>

#include <cstdint>
#include <string>
#include <vector>

namespace bt::client {

struct Call {
    enum class Result { code, count };

    const char* name; // the exported name without BT_SRV_
    const char* arguments; // in the grammar of the catalogues
    // Makes the call; a query adds what it copied out to `answer`.
    int32_t (*make)(const Arguments& arguments, nlohmann::ordered_json& answer);
    Result result = Result::code; // what the function returns: 0 for success, or a count
};

struct CallTable {
    const Call* first;
    const Call* end;
};

// One table per profile.
CallTable connection_calls();

std::vector<Call> all_calls();

// By name, with or without BT_SRV_. Throws Failure(kUsage), naming similar calls, when there is none.
Call find_call(const std::string& name);

} // namespace bt::client
