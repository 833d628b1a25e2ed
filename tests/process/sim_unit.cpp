#include "sim_unit.h"

#include <bt_platform/host.h>
#include <gtest/gtest.h>

#include <array>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <sys/wait.h>
#include <unistd.h>

namespace bt::test {

namespace {

constexpr int kLongestWaitMs = 20000;

int exit_code_of(pid_t pid)
{
    int status = 0;
    if (waitpid(pid, &status, 0) != pid) return -1000;
    return WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status);
}

void become_unit(const std::string& domain, const std::string& root, const std::string& name, int ready_fd)
{
    const std::string program = sim_path();
    const std::string scenario = std::string(BTSVC_SCENARIOS) + "/" + name + ".json";
    const std::string fd = std::to_string(ready_fd);
    execl(program.c_str(), "btsvc-sim", "--scenario", scenario.c_str(), "--domain", domain.c_str(), "--root",
          root.c_str(), "--ready-fd", fd.c_str(), static_cast<char*>(nullptr));
    _exit(126);
}

// Tells the domains of one run of the tests from those of another; applications inherit it.
const std::string& run_name()
{
    static const std::string name = std::to_string(getpid());
    return name;
}

} // namespace

std::string sim_path()
{
    const char* const given = std::getenv("BTSVC_SIM_PATH");
    return given != nullptr ? given : BTSVC_SIM_PATH;
}

SimUnit::SimUnit(std::string domain, const std::string& root, const std::string& scenario)
    : domain_(std::move(domain) + "-" + run_name())
{
    std::array<int, 2> ready{};
    if (pipe(ready.data()) != 0) return;
    pid_ = fork();
    if (pid_ == 0) {
        close(ready[0]);
        become_unit(domain_, root, scenario, ready[1]);
    }
    close(ready[1]);
    char text[6] = {};
    ready_ = read(ready[0], text, sizeof text) == sizeof text && std::memcmp(text, "ready\n", sizeof text) == 0;
    close(ready[0]);
}

SimUnit::~SimUnit()
{
    if (pid_ <= 0) return;
    send_signal(SIGTERM);
    wait_for_end();
}

void SimUnit::send_signal(int signal) const
{
    kill(pid_, signal);
}

int SimUnit::wait_for_end()
{
    if (pid_ > 0) end_ = exit_code_of(pid_);
    pid_ = -1;
    return end_;
}

TemporaryRoot::TemporaryRoot()
{
    std::string path = (std::filesystem::temp_directory_path() / "btsim-test-XXXXXX").string();
    path_ = mkdtemp(path.data());
}

TemporaryRoot::~TemporaryRoot()
{
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

std::vector<std::string> objects_of(const std::string& domain)
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator("/dev/shm"))
        if (entry.path().filename().string().find(domain) != std::string::npos)
            names.push_back(entry.path().filename().string());
    return names;
}

void as_application(const std::string& domain, const std::function<void()>& body)
{
    const pid_t pid = fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
        setenv("BT_PLATFORM_DOMAIN", domain.c_str(), 1);
        EXPECT_EQ(0, bt_host_claim_pno(BT_HOST_ANY_PNO)) << bt_host_error();
        if (!testing::Test::HasFailure()) body();
        bt_host_release_pno();
        std::fflush(nullptr);
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    EXPECT_EQ(0, exit_code_of(pid));
}

uint32_t listen_for(const std::vector<uint32_t>& event_ids)
{
    const uint32_t handle =
        BT_SRV_EvtSrv_regist(_sys_GetPno(), 0, static_cast<uint32_t>(event_ids.size()), event_ids.data());
    EXPECT_NE(0U, handle) << bt_host_error();
    return handle;
}

BtMessage next_event()
{
    BtMessage event{};
    if (bt_host_receive(&event, sizeof event, kLongestWaitMs) != 1) {
        ADD_FAILURE() << "no event came: " << bt_host_error();
        std::fflush(nullptr);
        _exit(1);
    }
    return event;
}

BtMessage wait_for(uint32_t event_id)
{
    SCOPED_TRACE("waiting for event " + std::to_string(event_id));
    for (;;) {
        const BtMessage event = next_event();
        if (event.msg_header.hdr.cid == event_id) return event;
    }
}

uint32_t word(const BtMessage& event, size_t offset)
{
    uint32_t value = 0;
    EXPECT_LE(offset + sizeof value, event.msg_header.hdr.len);
    std::memcpy(&value, event.payload + offset, sizeof value);
    return value;
}

BtDevAddress device_address(uint8_t first, uint8_t last)
{
    return {{first, 0, 0, 0, 0, last}, {0, 0}};
}

void request_connection(const BtDevAddress& address, uint32_t profile)
{
    const BtConParameters parameters = {profile, {}};
    ASSERT_EQ(0, BT_SRV_CON_requestConnection(&address, &parameters));
}

int32_t registered_count()
{
    const int32_t from = 0;
    BtConRegDevInfo records[BT_CON_DEVICE_MAX];
    return BT_SRV_CON_getRemoteDeviceList(0, &from, BT_CON_DEVICE_MAX, records);
}

uint32_t connection_mode(const BtDevAddress& address)
{
    uint32_t mode = 0;
    EXPECT_EQ(0, BT_SRV_CON_getConnectionMode(&address, &mode));
    return mode;
}

BtSimService service_at(uint32_t pno)
{
    void* address = nullptr;
    uint32_t size = sizeof(BtSimUnit);
    EXPECT_EQ(0, _sys_LinkShareData(kUnitDataName, &address, &size));
    const auto& unit = *static_cast<const BtSimUnit*>(address);
    for (uint32_t i = 0; i < unit.service_count; ++i)
        if (unit.services[i].pno == pno) return unit.services[i];
    ADD_FAILURE() << "the unit has no such service";
    return {};
}

void kill_connection_service()
{
    const auto pid = static_cast<pid_t>(service_at(PNO_BT_CON).pid);
    ASSERT_GT(pid, 0);
    ASSERT_EQ(0, kill(pid, SIGKILL));
}

} // namespace bt::test
