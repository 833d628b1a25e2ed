// A simulated unit under test, and applications that talk to it. Units and applications are processes of their own, so
// each test may use several domains; the test's own process never touches the platform layer.
#pragma once

#include "sim/unit_records.h"

#include <bt_service/bt_service.h>
#include <bt_sim/events.h>

#include <functional>
#include <string>
#include <sys/types.h>
#include <vector>

namespace bt::test {

// The program under test: BTSVC_SIM_PATH of the environment, else the one of this build.
std::string sim_path();

class SimUnit {
public:
    // Starts a unit with a shipped scenario and waits until it is ready or has ended.
    SimUnit(std::string domain, const std::string& root, const std::string& scenario = "two_phones");
    ~SimUnit();
    SimUnit(const SimUnit&) = delete;
    SimUnit& operator=(const SimUnit&) = delete;

    bool ready() const { return ready_; }
    const std::string& domain() const { return domain_; }
    void send_signal(int signal) const;
    // The exit code of the unit, minus the signal that ended it.
    int wait_for_end();

private:
    std::string domain_;
    pid_t pid_ = -1;
    bool ready_ = false;
    int end_ = 0;
};

// A folder that goes when the test ends.
class TemporaryRoot {
public:
    TemporaryRoot();
    ~TemporaryRoot();
    const std::string& path() const { return path_; }

private:
    std::string path_;
};

// The objects in shared memory that carry the domain's name.
std::vector<std::string> objects_of(const std::string& domain);

// Runs the body as an application of the domain, with a process number, and expects it to end without a failed check.
void as_application(const std::string& domain, const std::function<void()>& body);

// For applications: registers for events; what comes without being registered for is none of the test's business.
uint32_t listen_for(const std::vector<uint32_t>& event_ids);

// The next message of this application; its payload fields are read with word(). Fails the test when none comes.
BtMessage next_event();
// Drops events until one with the id comes.
BtMessage wait_for(uint32_t event_id);
uint32_t word(const BtMessage& event, size_t offset);

BtDevAddress device_address(uint8_t first, uint8_t last);

void request_connection(const BtDevAddress& address, uint32_t profile);
int32_t registered_count();
uint32_t connection_mode(const BtDevAddress& address);

// The record that the supervisor keeps about the service at the number.
BtSimService service_at(uint32_t pno);
// Kills the service; what is posted to it from then on waits until it is back.
void kill_connection_service();

} // namespace bt::test
