// A domain for each test, and messages that show when they are torn.
#pragma once

#include "process.h"

#include <bt_platform/host.h>
#include <bt_service/bt_message.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <tuple>

namespace bt::test {

constexpr uint32_t kPno = 0x08C1;
constexpr int32_t kLongMs = 20000; // for what has to come; never waited out

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

    const std::string name = "t" + std::to_string(getpid());
};

class Domain : public EmptyDomain {
protected:
    Domain() { EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error(); }
};

class OwnedNumber : public Domain {
protected:
    OwnedNumber() { EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error(); }
};

inline bool error_names(const std::string& part)
{
    return std::string(bt_host_error()).find(part) != std::string::npos;
}

// Every payload word holds the message's number.
struct Numbered {
    BtMessageHeaderFields header{};
    uint32_t words[252];

    explicit Numbered(uint32_t number = 0, uint16_t sender = 0)
    {
        header.src_pno = sender;
        header.len = sizeof words;
        std::fill(std::begin(words), std::end(words), number);
    }
    bool whole() const { return std::count(std::begin(words), std::end(words), words[0]) == 252; }
};
static_assert(sizeof(Numbered) == BT_MESSAGE_SIZE, "a numbered message fills its slot");

inline int32_t post(const Numbered& message, uint32_t pno = kPno)
{
    return _sys_SndMsg(pno, sizeof message, &message, 0);
}

// Posts and waits for room where there is none.
inline int32_t post_patiently(const Numbered& message)
{
    int32_t result = post(message);
    for (; result == 2 || result == 4; result = post(message))
        sched_yield();
    return result;
}

inline int32_t receive(Numbered* message, int32_t timeout_ms = kLongMs)
{
    return bt_host_receive(message, sizeof *message, timeout_ms);
}

inline BtHostQueue first_queue()
{
    BtHostQueue queue{};
    EXPECT_EQ(bt_host_list_queues(&queue, 1), 1) << bt_host_error();
    return queue;
}

inline BtHostLock first_lock()
{
    BtHostLock lock{};
    EXPECT_EQ(bt_host_list_locks(&lock, 1), 1) << bt_host_error();
    return lock;
}

} // namespace bt::test
