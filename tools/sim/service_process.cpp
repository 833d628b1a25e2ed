#include "sim/service_process.h"

#include <bt_platform/host.h>
#include <bt_service/bt_events.h>
#include <bt_service/bt_log.h>
#include <bt_service/bt_transport.h>
#include <fmt/core.h>

#include <algorithm>
#include <atomic>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <thread>
#include <unistd.h>

namespace bt::sim {

namespace {

constexpr uint32_t kLockNotHad = 4;
std::atomic<bool> told_to_end{false};
int supervisor_fd = -1;

// BT_EDS_initialize() gives a process its handle for dispatching, but also clears the listener table. Called while
// this thread holds the lock it keeps the handle and leaves the table: its own attempt to lock is refused.
void join_dispatch()
{
    const uint32_t handle = _sys_CreateSemaphore("BT_SRV_EDS_SEM_NAME");
    if (_sys_SemLock(handle) != 0) {
        fmt::print(stderr, "btsvc-sim: {}\n", bt_host_error());
        std::exit(EXIT_FAILURE);
    }
    BT_EDS_initialize();
    _sys_SemUnlock(handle);
}

// A service ends between two messages, never within one: SIGTERM becomes a message that wakes the receive.
void end_on_sigterm(sigset_t signals, uint32_t own_pno)
{
    int signal = 0;
    sigwait(&signals, &signal);
    told_to_end = true;
    const BtMessage wake{};
    while (_sys_SndMsg(own_pno, BT_MESSAGE_HEADER_SIZE, &wake, 0) == kLockNotHad) {
    }
}

void start_waiting_for_sigterm(uint32_t own_pno)
{
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    std::thread(end_on_sigterm, signals, own_pno).detach();
}

} // namespace

int run_service_process(const Service& service, const Scenario& scenario, int ready_fd)
{
    supervisor_fd = ready_fd;
    if (bt_host_claim_pno(service.pno) != 0) {
        fmt::print(stderr, "btsvc-sim: {}: number 0x{:04X} cannot be had: {}\n", service.name, service.pno,
                   bt_host_error());
        return EXIT_FAILURE;
    }
    start_waiting_for_sigterm(service.pno);
    BT_CMN_DebugLogSelecter();
    join_dispatch();
    service.run(scenario);
    bt_host_release_pno();
    return EXIT_SUCCESS;
}

void report_ready()
{
    if (supervisor_fd < 0) return;
    const char ready = 'R';
    if (write(supervisor_fd, &ready, 1) != 1) std::perror("btsvc-sim: report to the supervisor");
    close(supervisor_fd);
    supervisor_fd = -1;
}

bool next_message(BtMessage& message)
{
    do {
        std::memset(&message, 0, sizeof message);
        if (told_to_end) return false;
    } while (BT_CMN_recvMsgWrapper(__FILE__, __func__, __LINE__, &message) != 0 || told_to_end);

    uint16_t& length = message.msg_header.hdr.len;
    length = std::min<uint16_t>(length, BT_MESSAGE_PAYLOAD_MAX);
    std::memset(message.payload + length, 0, sizeof message.payload - length);
    return true;
}

} // namespace bt::sim
