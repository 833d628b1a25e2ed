#include "sim/shared_areas.h"

#include <bt_platform/host.h>
#include <bt_service/bt_types.h>
#include <fmt/format.h>

#include <cerrno>
#include <cstddef>
#include <cstring>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>
#include <vector>

namespace bt::sim {

namespace {

// Binding a name that vanishes with the process is the one exclusive claim that a kill cannot leave behind.
void claim_exclusively()
{
    sockaddr_un name{};
    name.sun_family = AF_UNIX;
    const std::string text = fmt::format("btsvc-sim/{}/{}", getuid(), bt_host_domain());
    std::memcpy(name.sun_path + 1, text.data(), text.size());

    const int claim = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    const auto size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + 1 + text.size());
    if (claim >= 0 && bind(claim, reinterpret_cast<sockaddr*>(&name), size) == 0) return;
    if (errno == EADDRINUSE)
        throw DomainTaken(fmt::format("domain \"{}\": a unit runs in it already; end it, or choose another domain with "
                                      "--domain",
                                      bt_host_domain()));
    throw UnitError(fmt::format("domain \"{}\": {}", bt_host_domain(), strerror(errno)));
}

std::vector<BtHostQueue> live_queues()
{
    std::vector<BtHostQueue> queues(4096);
    const int32_t count = bt_host_list_queues(queues.data(), static_cast<int32_t>(queues.size()));
    queues.resize(count < 0 ? 0 : static_cast<size_t>(count));

    std::vector<BtHostQueue> live;
    for (const BtHostQueue& queue : queues)
        if (queue.owner_pid != 0) live.push_back(queue);
    return live;
}

bool is_service(uint32_t pno)
{
    return (pno >= PNO_BT_SYS && pno <= PNO_BT_MAP) || pno == PNO_BT_EDS;
}

// Services end by themselves when their supervisor dies; one that was killed a moment ago may still have some running.
std::vector<BtHostQueue> live_queues_without_ending_services()
{
    constexpr int kTries = 100;
    for (int tries = 0;; ++tries) {
        const auto live = live_queues();
        const BtHostQueue* service = nullptr;
        for (const BtHostQueue& queue : live)
            if (is_service(queue.pno)) service = &queue;
        if (service == nullptr) return live;
        if (tries == kTries)
            throw DomainTaken(fmt::format("domain \"{}\": process {} still serves number 0x{:04X}; end it, or choose "
                                          "another domain with --domain",
                                          bt_host_domain(), service->owner_pid, service->pno));
        usleep(20000);
    }
}

} // namespace

void take_domain()
{
    claim_exclusively();
    int32_t created = bt_host_create_domain();
    if (created == 1 && live_queues_without_ending_services().empty()) {
        if (bt_host_remove_domain() != 0)
            throw UnitError(fmt::format("domain \"{}\": {}", bt_host_domain(), bt_host_error()));
        created = bt_host_create_domain();
    }
    if (created < 0) throw UnitError(fmt::format("domain \"{}\": {}", bt_host_domain(), bt_host_error()));
}

} // namespace bt::sim
