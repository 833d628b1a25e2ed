// A simulated unit under test, the applications in its domain, and the programs run on it. All are processes of their own,
// so each test may use several domains.
#pragma once

#include "process.h"
#include "sim/unit_records.h"

#include <bt_platform/host.h>
#include <bt_service/bt_service.h>
#include <bt_sim/events.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <string>
#include <tuple>
#include <vector>

namespace bt::test {

struct Ended {
    std::string out, err;
    int code;
};

[[noreturn]] inline void become(const std::string& command)
{
    execl("/bin/sh", "sh", "-c", ("exec " + command).c_str(), nullptr);
    std::_Exit(126);
}

// A program whose output is kept.
class Program {
public:
    explicit Program(const std::string& command)
        : process_([&] {
              out_.take(STDOUT_FILENO);
              err_.take(STDERR_FILENO);
              become(command);
          })
    {
    }
    Ended end(int signal = 0)
    {
        kill(process_.pid, signal);
        return {out_.text(), err_.text(), process_.end()};
    }

private:
    Capture out_, err_;
    Child process_;
};

// A unit with a shipped scenario and a root folder of its own.
struct Unit {
    explicit Unit(const std::string& name, const std::string& scenario = "two_phones")
        : domain(name + "-" + std::to_string(getpid())), process([&] {
              dup2(line_to_parent, 99);
              become("'" BTSVC_SIM_PATH "' --scenario '" BTSVC_SCENARIOS + scenario + ".json' --domain " + domain +
                     " --root " + root + " --ready-fd 99");
          })
    {
    }
    ~Unit()
    {
        process.end(SIGTERM);
        std::filesystem::remove_all(root);
    }

    const std::string domain;
    std::string root = testing::TempDir() + "btsim-test-XXXXXX";
    const bool has_root = mkdtemp(root.data()) != nullptr;
    Child process;
    const bool ready = hear(process.line); // or has ended
};

// Becomes an application of the domain, with a process number; for children.
inline void be_application(const std::string& domain, const std::function<void()>& body)
{
    setenv("BT_PLATFORM_DOMAIN", domain.c_str(), 1);
    ASSERT_EQ(0, bt_host_claim_pno(BT_HOST_ANY_PNO)) << bt_host_error();
    body();
    bt_host_release_pno();
}

inline void as_application(const std::string& domain, const std::function<void()>& body)
{
    EXPECT_TRUE(in_child([&] { be_application(domain, body); }));
}

inline uint32_t listen_for(const std::vector<uint32_t>& ids)
{
    const uint32_t handle = BT_SRV_EvtSrv_regist(_sys_GetPno(), 0, static_cast<uint32_t>(ids.size()), ids.data());
    EXPECT_NE(0U, handle) << bt_host_error();
    return handle;
}

// The next message of this application; ends it when none comes.
inline BtMessage next_event()
{
    BtMessage event{};
    if (bt_host_receive(&event, sizeof event, 20000) == 1) return event;
    ADD_FAILURE() << "no event came: " << bt_host_error();
    std::_Exit(1);
}

// A payload word of the next event with the id; others are dropped.
inline uint32_t wait_for(uint32_t id, size_t offset = 0)
{
    const testing::ScopedTrace trace(__FILE__, __LINE__, "waiting for event " + std::to_string(id));
    BtMessage event = next_event();
    while (event.msg_header.hdr.cid != id)
        event = next_event();
    uint32_t value = 0;
    EXPECT_LE(offset + sizeof value, event.msg_header.hdr.len);
    std::memcpy(&value, event.payload + offset, sizeof value);
    return value;
}

// Posts a connection request and compares a payload word of the event that comes of it.
#define EXPECT_ANSWER(call, event, offset, value)                                                                      \
    EXPECT_EQ(0, BT_SRV_CON_##call);                                                                                   \
    EXPECT_EVENT(event, offset, value)
#define EXPECT_EVENT(event, offset, value)                                                                             \
    EXPECT_EQ(static_cast<uint32_t>(value), wait_for(BT_SIM_EVENT_CON_##event, offset))

constexpr BtDevAddress phone(uint8_t first, uint8_t last)
{
    return {{first, 0, 0, 0, 0, last}, {0, 0}};
}
constexpr BtDevAddress kAnna = phone(0xA0, 1);

inline const BtSimService& connection_service()
{
    const auto& services = static_cast<const BtSimUnit*>(link_data(kUnitDataName))->services;
    return *std::find_if(std::begin(services), std::end(services), [](auto& s) { return s.pno == PNO_BT_CON; });
}

} // namespace bt::test
