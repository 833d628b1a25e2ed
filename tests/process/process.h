// Processes that tests start, talk to and kill.
#pragma once

#include <bt_platform/host.h>
#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <functional>
#include <string>

namespace bt::test {

// Parent and child share a line: one end says a byte, the other waits for it.
inline int line_to_parent = -1;

inline void say(int line)
{
    EXPECT_EQ(send(line, "!", 1, MSG_NOSIGNAL), 1);
}

// False when the other end is gone.
inline bool hear(int line)
{
    char byte = 0;
    ssize_t got = 0;
    do
        got = read(line, &byte, 1);
    while (got == -1 && errno == EINTR);
    return got == 1;
}

// A child tells its parent how far it is, and waits for its word.
inline void stand()
{
    say(line_to_parent);
    hear(line_to_parent);
}

// A child process that runs `body`; the expectations in it count as its result.
class Child {
public:
    explicit Child(const std::function<void()>& body)
    {
        int ends[2];
        if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) != 0) std::abort();
        line = ends[0];
        pid = fork();
        close(ends[pid == 0 ? 0 : 1]);
        if (pid != 0) return;
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        line_to_parent = ends[1];
        body();
        std::fflush(nullptr);
        std::_Exit(testing::Test::HasFailure() ? 1 : 0);
    }
    ~Child()
    {
        end(SIGKILL);
        close(line);
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;

    // Sends the signal, if any, and waits for the end: the exit code, or minus the signal that ended it.
    int end(int signal = 0)
    {
        if (!waited_) kill(pid, signal);
        while (!waited_)
            waited_ = waitpid(pid, &status_, 0) == pid;
        return WIFSIGNALED(status_) ? -WTERMSIG(status_) : WEXITSTATUS(status_);
    }

    pid_t pid;
    int line;

private:
    bool waited_ = false;
    int status_ = 0;
};

inline bool in_child(const std::function<void()>& body)
{
    return Child(body).end() == 0;
}

inline void* link_data(const char* data, uint32_t* size = nullptr)
{
    void* address = nullptr;
    EXPECT_EQ(_sys_LinkShareData(data, &address, size), 0) << bt_host_error();
    return address;
}

// A child's output stream.
class Capture {
public:
    Capture()
    {
        if (pipe2(ends_, O_CLOEXEC) != 0) std::abort();
    }
    ~Capture() { close(ends_[0]); }

    void take(int stream) { dup2(ends_[1], stream); }

    // What the child writes until its end.
    std::string text()
    {
        close(ends_[1]);
        std::string all;
        char part[4096];
        for (ssize_t got = 0; (got = read(ends_[0], part, sizeof part)) > 0;)
            all.append(part, static_cast<size_t>(got));
        return all;
    }

private:
    int ends_[2];
};

} // namespace bt::test
