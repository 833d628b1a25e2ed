#include "sim/supervisor.h"

#include "sim/children.h"
#include "sim/shared_areas.h"

#include <bt_platform/host.h>
#include <bt_service/bt_events.h>
#include <fmt/format.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <poll.h>
#include <sys/signalfd.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace bt::sim {

namespace {

constexpr auto kTimeToEnd = std::chrono::seconds(3);

int open_signals()
{
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGTERM, SIGINT, SIGHUP, SIGCHLD})
        sigaddset(&signals, signal);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    signal(SIGPIPE, SIG_IGN);
    const int fd = signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK);
    if (fd < 0) throw UnitError(fmt::format("signalfd: {}", strerror(errno)));
    return fd;
}

BtSimUnit& link_unit_record(const std::string& root)
{
    void* address = nullptr;
    uint32_t size = sizeof(BtSimUnit);
    if (_sys_LinkShareData(kUnitDataName, &address, &size) != 0)
        throw UnitError(fmt::format("shared data {}: {}", kUnitDataName, bt_host_error()));
    auto& record = *static_cast<BtSimUnit*>(address);
    record = {};
    record.supervisor_pid = static_cast<uint32_t>(getpid());
    std::strncpy(record.root, root.c_str(), sizeof record.root - 1);
    return record;
}

void announce_ready(int fd)
{
    static constexpr char text[] = "ready\n";
    if (write(fd < 0 ? STDOUT_FILENO : fd, text, sizeof text - 1) < 0) std::perror("btsvc-sim: ready");
    if (fd >= 0) close(fd);
}

struct RemoveDomainAtEnd {
    ~RemoveDomainAtEnd() { bt_host_remove_domain(); }
};

// The supervisor's loop, the only place where signals, deaths and restarts are handled.
class Supervisor {
public:
    Supervisor(const UnitOptions& options, int signal_fd)
        : options_(options), signal_fd_(signal_fd), children_(options.scenario_file, link_unit_record(options.root))
    {
    }

    int run()
    {
        children_.start_all();
        while (!stop_)
            step(children_.start_due());
        children_.end_all(SIGTERM);
        const auto deadline = Clock::now() + kTimeToEnd;
        while (children_.any_running()) {
            const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now()).count();
            if (left <= 0) children_.end_all(SIGKILL);
            step(left > 0 ? static_cast<int>(left) : -1);
        }
        return exit_code_;
    }

private:
    void step(int timeout_ms)
    {
        std::vector<pollfd> polled = {{signal_fd_, POLLIN, 0}};
        for (const int fd : children_.ready_fds())
            polled.push_back({fd, POLLIN, 0});
        if (poll(polled.data(), polled.size(), timeout_ms) <= 0) return;

        for (size_t i = 1; i < polled.size(); ++i)
            if (polled[i].revents != 0) children_.ready_changed(polled[i].fd);
        take_signals();
        if (!announced_ && !stop_ && children_.all_ready()) {
            announce_ready(options_.ready_fd);
            announced_ = true;
        }
    }

    void take_signals()
    {
        signalfd_siginfo signal{};
        while (read(signal_fd_, &signal, sizeof signal) == sizeof signal)
            if (signal.ssi_signo != SIGCHLD) stop_ = true;
        // Several deaths may share one signal, so all that can be reaped are.
        int status = 0;
        for (pid_t pid = waitpid(-1, &status, WNOHANG); pid > 0; pid = waitpid(-1, &status, WNOHANG))
            if (!children_.reaped(pid, status)) {
                stop_ = true;
                exit_code_ = kExitFailed;
            }
    }

    const UnitOptions& options_;
    int signal_fd_;
    Children children_;
    bool stop_ = false;
    bool announced_ = false;
    int exit_code_ = kExitDone;
};

} // namespace

int run_unit(const UnitOptions& options)
{
    try {
        const int signal_fd = open_signals();
        // The services must not keep it open.
        if (options.ready_fd >= 0) fcntl(options.ready_fd, F_SETFD, FD_CLOEXEC);
        umask(S_IRWXG | S_IRWXO);
        take_domain();
        const RemoveDomainAtEnd remove_domain;
        create_areas();
        create_folders(options.root);
        BT_EDS_initialize();
        fmt::print(stderr, "btsvc-sim: domain \"{}\", root {}\n", bt_host_domain(), options.root);
        return Supervisor(options, signal_fd).run();
    } catch (const DomainTaken& error) {
        fmt::print(stderr, "btsvc-sim: {}\n", error.what());
        return kExitDomainTaken;
    } catch (const UnitError& error) {
        fmt::print(stderr, "btsvc-sim: {}\n", error.what());
        return kExitFailed;
    }
}

} // namespace bt::sim
