#include "client_run.h"

#include <array>
#include <csignal>
#include <cstdlib>
#include <poll.h>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace bt::test {
namespace {

std::string client_path()
{
    const char* const given = std::getenv("BTSVC_PATH");
    return given != nullptr ? given : BTSVC_PATH;
}

[[noreturn]] void become_client(const std::string& domain, const std::vector<std::string>& arguments)
{
    setenv("BT_PLATFORM_DOMAIN", domain.c_str(), 1);
    const std::string program = client_path();
    std::vector<char*> words{const_cast<char*>("btsvc")};
    for (const std::string& argument : arguments)
        words.push_back(const_cast<char*>(argument.c_str()));
    words.push_back(nullptr);
    execv(program.c_str(), words.data());
    _exit(126);
}

// Both ends at once, so that neither pipe fills up unread.
void read_both(int out, int err, ClientRun& run)
{
    std::array<pollfd, 2> pipes{{{out, POLLIN, 0}, {err, POLLIN, 0}}};
    std::array<std::string*, 2> texts{&run.out, &run.err};
    for (int open = 2; open > 0;) {
        if (poll(pipes.data(), pipes.size(), -1) < 0) continue;
        for (size_t i = 0; i < pipes.size(); ++i) {
            if (pipes[i].revents == 0) continue;
            std::array<char, 4096> part{};
            const ssize_t got = read(pipes[i].fd, part.data(), part.size());
            if (got > 0) {
                texts[i]->append(part.data(), static_cast<size_t>(got));
            } else {
                pipes[i].fd = -1;
                --open;
            }
        }
    }
}

} // namespace

std::vector<std::string> ClientRun::lines() const
{
    std::vector<std::string> all;
    std::istringstream stream(out);
    for (std::string line; std::getline(stream, line);)
        all.push_back(line);
    return all;
}

BackgroundClient::BackgroundClient(const std::string& domain, const std::vector<std::string>& arguments, Output output)
{
    std::array<int, 2> out{}, err{};
    if (pipe(out.data()) != 0 || pipe(err.data()) != 0) std::abort();
    pid_ = fork();
    if (pid_ == 0) {
        dup2(out[1], STDOUT_FILENO);
        dup2(err[1], STDERR_FILENO);
        for (const int fd : {out[0], out[1], err[0], err[1]})
            close(fd);
        if (output == Output::closed) close(STDOUT_FILENO);
        become_client(domain, arguments);
    }
    close(out[1]);
    close(err[1]);
    out_ = out[0];
    err_ = err[0];
}

BackgroundClient::~BackgroundClient()
{
    if (pid_ > 0) end(SIGKILL);
}

ClientRun BackgroundClient::end(int signal)
{
    kill(pid_, signal);
    return wait();
}

ClientRun BackgroundClient::wait()
{
    ClientRun run;
    read_both(out_, err_, run);
    int status = 0;
    waitpid(pid_, &status, 0);
    run.exit_code = WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status);
    close(out_);
    close(err_);
    pid_ = -1;
    return run;
}

ClientRun run_client(const std::string& domain, const std::vector<std::string>& arguments, Output output)
{
    return BackgroundClient(domain, arguments, output).wait();
}

} // namespace bt::test
