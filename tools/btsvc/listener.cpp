#include "btsvc/listener.h"

#include "btsvc/failure.h"
#include "btsvc/unit.h"

#include <bt_platform/host.h>
#include <bt_service/bt_events.h>

#include <fmt/format.h>

#include <algorithm>
#include <csignal>

#include <poll.h>

namespace bt::client {
namespace {

constexpr size_t kIdsPerEntry = 35;
constexpr uint32_t kTag = 0x62747376; // marks this program's entries in the listener table
constexpr int64_t kLookAroundMs = 1000; // how often a wait checks that the unit is still there

volatile std::sig_atomic_t g_stop = 0;
sigset_t g_outside_wait; // the signal mask in force while waiting

void note_stop(int)
{
    g_stop = 1;
}

int64_t wait_ms(Deadline until)
{
    if (!until) return kLookAroundMs;
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(*until - Clock::now()).count();
    return std::clamp<int64_t>(left, 0, kLookAroundMs);
}

// Stop signals are delivered only in here, so that none falls between the look at the flag and the wait.
void sleep_until_message(int fd, int64_t milliseconds)
{
    pollfd waiting{fd, POLLIN, 0};
    const timespec limit{milliseconds / 1000, milliseconds % 1000 * 1000000};
    ::ppoll(&waiting, 1, &limit, &g_outside_wait);
}

void require_own_queue()
{
    const uint32_t own = _sys_GetPno();
    for (const BtHostQueue& queue : queues())
        if (queue.pno == own) return;
    throw Failure(kNoUnit, fmt::format("the unit in domain \"{}\" was removed while waiting", bt_host_domain()));
}

} // namespace

void catch_stop_signals()
{
    struct sigaction action {};
    action.sa_handler = note_stop;
    sigset_t stops;
    ::sigemptyset(&stops);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        ::sigaction(signal, &action, nullptr);
        ::sigaddset(&stops, signal);
    }
    ::sigprocmask(SIG_BLOCK, &stops, &g_outside_wait);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP})
        ::sigdelset(&g_outside_wait, signal);
}

bool stop_requested()
{
    return g_stop != 0;
}

Deadline time_limit(double seconds)
{
    if (seconds <= 0) return std::nullopt;
    return Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(seconds));
}

Listener::Listener(const std::vector<uint32_t>& event_ids)
{
    require_process(PNO_BT_EDS);
    if (bt_host_claim_pno(BT_HOST_ANY_PNO) != 0)
        throw Failure(kNoUnit, fmt::format("no process number could be claimed: {}", bt_host_error()));

    for (size_t first = 0; first < event_ids.size(); first += kIdsPerEntry) {
        const size_t count = std::min(kIdsPerEntry, event_ids.size() - first);
        const uint32_t handle =
            BT_SRV_EvtSrv_regist(_sys_GetPno(), kTag, static_cast<uint32_t>(count), event_ids.data() + first);
        if (handle == 0) {
            leave();
            throw Failure(kRefused, "registration as a listener was refused: the listener table is full or not "
                                    "initialised; `btsvc status` shows its entries");
        }
        handles_.push_back(handle);
    }
}

Listener::~Listener()
{
    leave();
}

void Listener::leave()
{
    for (const uint32_t handle : handles_)
        BT_SRV_EvtSrv_deregist(handle);
    bt_host_release_pno();
}

std::optional<BtMessage> Listener::next(Deadline until)
{
    const int fd = bt_host_receive_fd();
    while (!stop_requested()) {
        BtMessage message{};
        const int32_t received = bt_host_receive(&message, sizeof message, 0);
        if (received == 1) return message;
        if (received < 0) throw Failure(kNoUnit, fmt::format("events can no longer be received: {}", bt_host_error()));
        if (until && Clock::now() >= *until) return std::nullopt;

        require_own_queue();
        sleep_until_message(fd, wait_ms(until));
    }
    return std::nullopt;
}

} // namespace bt::client
