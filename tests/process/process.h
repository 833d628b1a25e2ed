// Processes that tests start, talk to and kill.
#pragma once

#include <gtest/gtest.h>

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

// A file in the place of a child's output stream.
class Capture {
public:
    ~Capture() { std::fclose(file_); }

    void take(int stream) { dup2(fileno(file_), stream); }
    std::string text() const
    {
        std::string all(static_cast<size_t>(lseek(fileno(file_), 0, SEEK_END)), '\0');
        EXPECT_EQ(pread(fileno(file_), all.data(), all.size(), 0), static_cast<ssize_t>(all.size()));
        return all;
    }

private:
    std::FILE* const file_ = std::tmpfile();
};

} // namespace bt::test
