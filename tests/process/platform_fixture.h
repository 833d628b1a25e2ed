// A domain for each test, and children that are told and watched through pipes.
#pragma once

#include <bt_platform/host.h>
#include <bt_service/bt_message.h>

#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>

namespace platform_test {

constexpr uint32_t kPno = 0x08C1;

inline std::string new_domain_name()
{
    static int count = 0;
    return "t" + std::to_string(getpid()) + "_" + std::to_string(++count);
}

// The test process does not create the domain, nor map anything of it, before the test does.
class EmptyDomain : public testing::Test {
protected:
    EmptyDomain()
    {
        setenv("BT_PLATFORM_DOMAIN", name.c_str(), 1);
        unsetenv("BT_PLATFORM_PNO");
    }

    ~EmptyDomain() override
    {
        bt_host_release_pno();
        setenv("BT_PLATFORM_DOMAIN", name.c_str(), 1);
        bt_host_remove_domain();
    }

    const std::string name = new_domain_name();
};

class Domain : public EmptyDomain {
protected:
    Domain() { EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error(); }
};

// The way between parent and child: either side says a byte, the other waits for it.
class Line {
public:
    Line()
    {
        if (pipe(up_) != 0 || pipe(down_) != 0) std::abort();
    }
    ~Line()
    {
        for (const int fd : {up_[0], up_[1], down_[0], down_[1]})
            close(fd);
    }
    Line(const Line&) = delete;
    Line& operator=(const Line&) = delete;

    void say_to_parent() { say(up_[1]); }
    void say_to_child() { say(down_[1]); }
    void hear_child() { hear(up_[0]); }
    void hear_parent() { hear(down_[0]); }

private:
    static void say(int fd)
    {
        if (write(fd, "!", 1) != 1) std::abort();
    }
    static void hear(int fd)
    {
        char byte = 0;
        while (read(fd, &byte, 1) == -1 && errno == EINTR) {
        }
    }

    int up_[2], down_[2];
};

// A child process that runs `body`; the expectations in it count as its result.
class Child {
public:
    explicit Child(const std::function<void()>& body) : pid(fork())
    {
        if (pid != 0) return;
        body();
        std::_Exit(testing::Test::HasFailure() ? 1 : 0);
    }
    ~Child()
    {
        if (!waited_) kill_now();
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;

    // True when it ended by itself and no expectation in it failed.
    bool succeeded()
    {
        const int status = wait_for_end();
        return WIFEXITED(status) && WEXITSTATUS(status) == 0;
    }

    int exit_code()
    {
        const int status = wait_for_end();
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    void kill_now()
    {
        kill(pid, SIGKILL);
        wait_for_end();
    }

    const pid_t pid;

private:
    int wait_for_end()
    {
        int status = 0;
        while (waitpid(pid, &status, 0) == -1 && errno == EINTR) {
        }
        waited_ = true;
        return status;
    }

    bool waited_ = false;
};

inline bool in_child(const std::function<void()>& body)
{
    return Child(body).succeeded();
}

// A message that shows when it is torn: every payload word holds its number.
struct Numbered {
    BtMessageHeaderFields header;
    uint32_t words[252];

    explicit Numbered(uint32_t number = 0, uint16_t sender = 0) : header{}
    {
        header.src_pno = sender;
        header.len = sizeof words;
        for (uint32_t& word : words)
            word = number;
    }

    bool whole() const
    {
        for (const uint32_t word : words) {
            if (word != words[0]) return false;
        }
        return true;
    }
};
static_assert(sizeof(Numbered) == BT_MESSAGE_SIZE, "a numbered message fills its slot");

inline int32_t post(const Numbered& message, uint32_t pno = kPno)
{
    return _sys_SndMsg(pno, sizeof message, &message, 0);
}

// Posts and waits for room where there is none.
inline int32_t post_patiently(const Numbered& message, uint32_t pno = kPno)
{
    int32_t result = post(message, pno);
    while (result == 2 || result == 4) {
        sched_yield();
        result = post(message, pno);
    }
    return result;
}

inline int32_t receive(Numbered* message, int32_t timeout_ms)
{
    return bt_host_receive(message, sizeof *message, timeout_ms);
}

constexpr int32_t kLongMs = 20000; // for what has to come; never waited out

} // namespace platform_test
