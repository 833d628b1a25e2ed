// The unit a command talks to: the domain in force and whether somebody is at home there.
#pragma once

#include <bt_platform/host.h>

#include <cstdint>
#include <string>
#include <vector>

namespace bt::client {

// Puts the domain and the root folder in force; an empty one leaves the environment's choice. Before any other call.
void select_unit(const std::string& domain, const std::string& root);

// The processes of the domain. Throws Failure(kNoUnit) when there is no such domain or it cannot be read.
std::vector<BtHostQueue> queues();
std::vector<BtHostLock> locks();
std::vector<BtHostData> shared_data();

// Throws Failure(kNoUnit) unless the domain exists.
void require_domain();

bool process_alive(uint16_t pno);

// Throws Failure(kNoUnit) unless a live process owns the number.
void require_process(uint16_t pno);

// Attaches the connection data area. Throws Failure(kNoUnit) when there is none.
void require_connection_area();

// "connection", "system", ...; empty for numbers that no service process has.
const char* process_name(uint32_t pno);

} // namespace bt::client
