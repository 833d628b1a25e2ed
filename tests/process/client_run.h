// Runs btsvc as a user would and keeps what it printed.
#pragma once

#include <string>
#include <vector>

namespace bt::test {

struct ClientRun {
    int exit_code = -1; // minus the signal that ended it
    std::string out;
    std::string err;
    std::vector<std::string> lines() const; // of out
};

enum class Output { kept, closed };

ClientRun run_client(const std::string& domain, const std::vector<std::string>& arguments,
                     Output output = Output::kept);

// The same in the background; end() sends a signal and waits.
class BackgroundClient {
public:
    BackgroundClient(const std::string& domain, const std::vector<std::string>& arguments,
                     Output output = Output::kept);
    ~BackgroundClient();
    BackgroundClient(const BackgroundClient&) = delete;
    BackgroundClient& operator=(const BackgroundClient&) = delete;

    ClientRun end(int signal);
    ClientRun wait();

private:
    int pid_ = -1;
    int out_ = -1;
    int err_ = -1;
};

} // namespace bt::test
