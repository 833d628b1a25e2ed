// The service processes as their supervisor sees them: started one after the other, started again when they die.
#pragma once

#include "sim/service_table.h"
#include "sim/unit_records.h"

#include <chrono>
#include <string>
#include <sys/types.h>
#include <vector>

namespace bt::sim {

using Clock = std::chrono::steady_clock;

class Children {
public:
    // `record` is the unit's record in shared data, kept up to date here.
    Children(std::string scenario_file, BtSimUnit& record);

    void start_all() { start(0); }
    bool all_ready() const;

    // A child of the process has died; false when the service cannot be made to start.
    bool reaped(pid_t pid, int status);
    // Bytes or the end have come on a service's ready descriptor. Starts the next service of a unit that comes up.
    void ready_changed(int fd);
    std::vector<int> ready_fds() const;

    // Starts what is due; returns the milliseconds until the next is, -1 for none.
    int start_due();

    void end_all(int signal);
    bool any_running() const;

private:
    struct Child {
        const Service* service = nullptr;
        pid_t pid = 0;
        int ready_fd = -1;
        bool ready = false;
        bool came_up = false; // it was ready at least once
        int failures = 0; // deaths in a row without having served for a while
        int failed_starts = 0; // deaths in a row before it was ready
        Clock::time_point started{};
        bool waits_for_restart = false;
        Clock::time_point restart_at{};
    };

    void start(size_t index);
    [[noreturn]] void become(const Child& child, int ready_fd, pid_t supervisor) const;
    void publish(size_t index, bool started);
    void close_ready(Child& child) const;

    std::string scenario_file_;
    BtSimUnit& record_;
    std::vector<Child> children_;
    bool ending_ = false;
};

} // namespace bt::sim
