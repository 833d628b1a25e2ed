#include "btsvc/unit.h"

#include "btsvc/failure.h"

#include <bt_service/bt_connection_store.h>
#include <bt_service/bt_types.h>

#include <fmt/format.h>

#include <algorithm>
#include <cstdlib>

namespace bt::client {
namespace {

constexpr const char* kRemedy = "`btsvc-sim` starts a simulated unit, --domain names another one";

[[noreturn]] void refuse_domain()
{
    const std::string reason = bt_host_error();
    throw Failure(kNoUnit, fmt::format("{}; {}", reason.empty() ? "the domain cannot be read" : reason, kRemedy));
}

// Asks with a growing buffer until the whole list fits.
template <class Record>
std::vector<Record> list_all(int32_t (*list)(Record*, int32_t))
{
    for (std::vector<Record> records(64);; records.resize(records.size() * 2)) {
        const int32_t count = list(records.data(), static_cast<int32_t>(records.size()));
        if (count < 0) refuse_domain();
        if (static_cast<size_t>(count) < records.size()) {
            records.resize(static_cast<size_t>(count));
            return records;
        }
    }
}

} // namespace

void select_unit(const std::string& domain, const std::string& root)
{
    if (!domain.empty()) ::setenv("BT_PLATFORM_DOMAIN", domain.c_str(), 1);
    if (!root.empty()) ::setenv("BT_SERVICE_ROOT", root.c_str(), 1);
}

std::vector<BtHostQueue> queues()
{
    return list_all(bt_host_list_queues);
}
std::vector<BtHostLock> locks()
{
    return list_all(bt_host_list_locks);
}
std::vector<BtHostData> shared_data()
{
    return list_all(bt_host_list_data);
}

void require_domain()
{
    queues();
}

bool process_alive(uint16_t pno)
{
    const std::vector<BtHostQueue> known = queues();
    return std::any_of(known.begin(), known.end(),
                       [pno](const BtHostQueue& queue) { return queue.pno == pno && queue.owner_pid != 0; });
}

void require_process(uint16_t pno)
{
    if (process_alive(pno)) return;
    throw Failure(kNoUnit, fmt::format("no live {} process (number 0x{:04X}) in domain \"{}\"; {}", process_name(pno),
                                       pno, bt_host_domain(), kRemedy));
}

void require_connection_area()
{
    require_domain(); // a missing domain has a clearer text than a missing area
    const int32_t result = bt_con_ApiInit(0);
    if (result != 0)
        throw Failure(kNoUnit,
                      fmt::format("connection data area of domain \"{}\" cannot be attached (result {}): {}; {}",
                                  bt_host_domain(), result, bt_host_error(), kRemedy));
}

const char* process_name(uint32_t pno)
{
    switch (pno) {
    case PNO_BT_SYS:
        return "system";
    case PNO_BT_CON:
        return "connection";
    case PNO_BT_HFP:
        return "hands-free";
    case PNO_BT_AVP:
        return "audio/video";
    case PNO_BT_STRM:
        return "stream";
    case PNO_BT_OPP:
        return "object push";
    case PNO_BT_MAP:
        return "message access";
    case PNO_BT_EDS:
        return "event distribution";
    default:
        return "";
    }
}

} // namespace bt::client
