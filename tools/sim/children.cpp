#include "sim/children.h"

#include "sim/shared_areas.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace bt::sim {

namespace {

constexpr auto kServedForAWhile = std::chrono::seconds(2);
constexpr int kMostFailedStarts = 5;
constexpr int kLongestBackOffMs = 1000;

// The first restart is immediate, the following ones are further and further apart.
std::chrono::milliseconds back_off(int failures)
{
    if (failures <= 1) return std::chrono::milliseconds(0);
    return std::chrono::milliseconds(std::min(kLongestBackOffMs, 50 << std::min(failures - 2, 5)));
}

std::string how_it_ended(int status)
{
    if (WIFSIGNALED(status))
        return fmt::format("was ended by signal {} ({})", WTERMSIG(status), strsignal(WTERMSIG(status)));
    return fmt::format("ended with code {}", WEXITSTATUS(status));
}

} // namespace

Children::Children(std::string scenario_file, BtSimUnit& record)
    : scenario_file_(std::move(scenario_file)), record_(record)
{
    const size_t count = std::min(services().size(), std::size(record_.services));
    children_.resize(count);
    for (size_t i = 0; i < count; ++i) {
        children_[i].service = &services()[i];
        record_.services[i] = {};
        record_.services[i].pno = services()[i].pno;
        std::strncpy(record_.services[i].name, services()[i].name, sizeof record_.services[i].name - 1);
    }
    record_.service_count = static_cast<uint32_t>(count);
}

bool Children::all_ready() const
{
    return std::all_of(children_.begin(), children_.end(), [](const Child& child) { return child.ready; });
}

bool Children::any_running() const
{
    return std::any_of(children_.begin(), children_.end(), [](const Child& child) { return child.pid != 0; });
}

std::vector<int> Children::ready_fds() const
{
    std::vector<int> fds;
    for (const Child& child : children_)
        if (child.ready_fd >= 0) fds.push_back(child.ready_fd);
    return fds;
}

void Children::publish(size_t index, bool started)
{
    BtSimService& service = record_.services[index];
    service.pid = static_cast<uint32_t>(children_[index].pid);
    if (started) ++service.starts;
}

void Children::close_ready(Child& child) const
{
    if (child.ready_fd >= 0) close(child.ready_fd);
    child.ready_fd = -1;
}

void Children::become(const Child& child, int ready_fd, pid_t supervisor) const
{
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    // Ctrl-C reaches the whole foreground group; the supervisor alone decides what it means.
    signal(SIGINT, SIG_IGN);
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    if (getppid() != supervisor) _exit(EXIT_FAILURE);

    fcntl(ready_fd, F_SETFD, 0);
    const std::string fd = std::to_string(ready_fd);
    execl("/proc/self/exe", "btsvc-sim", "--scenario", scenario_file_.c_str(), "--service", child.service->name,
          "--ready-fd", fd.c_str(), static_cast<char*>(nullptr));
    std::perror("btsvc-sim: /proc/self/exe");
    _exit(EXIT_FAILURE);
}

void Children::start(size_t index)
{
    Child& child = children_[index];
    int ready[2];
    if (pipe2(ready, O_CLOEXEC) != 0) throw UnitError(fmt::format("pipe: {}", strerror(errno)));

    const pid_t supervisor = getpid();
    const pid_t pid = fork();
    if (pid < 0) throw UnitError(fmt::format("fork: {}", strerror(errno)));
    if (pid == 0) become(child, ready[1], supervisor);

    close(ready[1]);
    child.pid = pid;
    child.ready_fd = ready[0];
    child.ready = false;
    child.waits_for_restart = false;
    child.started = Clock::now();
    publish(index, true);
}

void Children::ready_changed(int fd)
{
    const auto found =
        std::find_if(children_.begin(), children_.end(), [&](const Child& child) { return child.ready_fd == fd; });
    if (found == children_.end()) return;

    char byte = 0;
    const bool reported = read(fd, &byte, 1) == 1;
    close_ready(*found);
    if (!reported) return;

    const bool first_time = !found->came_up;
    found->ready = found->came_up = true;
    const auto next = static_cast<size_t>(found - children_.begin()) + 1;
    if (first_time && !ending_ && next < children_.size()) start(next);
}

bool Children::reaped(pid_t pid, int status)
{
    const auto found =
        std::find_if(children_.begin(), children_.end(), [&](const Child& child) { return child.pid == pid; });
    if (found == children_.end()) return true;

    const bool served = found->ready && Clock::now() - found->started >= kServedForAWhile;
    const bool reached_ready = found->ready;
    found->pid = 0;
    found->ready = false;
    close_ready(*found);
    publish(static_cast<size_t>(found - children_.begin()), false);
    if (ending_) return true;

    found->failures = served ? 1 : found->failures + 1;
    // Whoever kills a service while it starts does not make it one that cannot start.
    const bool killed = WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL;
    found->failed_starts = reached_ready ? 0 : found->failed_starts + (killed ? 0 : 1);
    const std::string who = fmt::format("{} (0x{:04X}, process {})", found->service->name, found->service->pno, pid);
    if (found->failed_starts >= kMostFailedStarts) {
        fmt::print(stderr, "btsvc-sim: {} {} before it served, {} times; mend what it says above and start again\n",
                   who, how_it_ended(status), found->failed_starts);
        return false;
    }
    const auto delay = back_off(found->failures);
    fmt::print(stderr, "btsvc-sim: {} {}; starting it again in {} ms\n", who, how_it_ended(status), delay.count());
    found->waits_for_restart = true;
    found->restart_at = Clock::now() + delay;
    return true;
}

int Children::start_due()
{
    int next_ms = -1;
    for (size_t i = 0; i < children_.size(); ++i) {
        const Child& child = children_[i];
        if (!child.waits_for_restart) continue;
        const auto wait = std::chrono::ceil<std::chrono::milliseconds>(child.restart_at - Clock::now()).count();
        if (wait <= 0)
            start(i);
        else if (next_ms < 0 || wait < next_ms)
            next_ms = static_cast<int>(wait);
    }
    return next_ms;
}

void Children::end_all(int signal)
{
    ending_ = true;
    for (Child& child : children_) {
        child.waits_for_restart = false;
        if (child.pid != 0) kill(child.pid, signal);
    }
}

} // namespace bt::sim
