// btsvc against a running unit: its answers, its JSON, its exit codes, and bytes of any kind in the shared areas.
#include "client_run.h"
#include "sim_unit.h"

#include <bt_platform/platform.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <random>

namespace bt::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

constexpr const char* kAnna = "A0:00:00:00:00:01";

class ClientUnit : public testing::Test {
protected:
    void SetUp() override { ASSERT_TRUE(unit_.ready()); }

    ClientRun run(const std::vector<std::string>& arguments) const { return run_client(unit_.domain(), arguments); }

    // Every line must be one JSON object of this version.
    std::vector<json> run_json(std::vector<std::string> arguments, int exit_code = 0) const
    {
        arguments.insert(arguments.begin(), "--json");
        const ClientRun done = run(arguments);
        EXPECT_EQ(done.exit_code, exit_code) << done.err;
        std::vector<json> objects;
        for (const std::string& line : done.lines()) {
            objects.push_back(json::parse(line, nullptr, false));
            const bool whole = objects.back().is_object();
            EXPECT_TRUE(whole && objects.back().value("version", 0) == 1) << line;
        }
        return objects;
    }

    std::vector<json> status_lines(const std::string& type) const
    {
        std::vector<json> lines = run_json({"status"});
        lines.erase(std::remove_if(lines.begin(), lines.end(),
                                   [&type](const json& line) { return line.value("type", "") != type; }),
                    lines.end());
        return lines;
    }

    // Overwrites shared data of the unit with what `change` makes of its bytes.
    void scribble(const char* name, void (*change)(uint8_t* bytes, uint32_t size)) const
    {
        as_application(unit_.domain(), [name, change] {
            void* address = nullptr;
            uint32_t size = 0;
            ASSERT_EQ(0, _sys_LinkShareData(name, &address, &size));
            change(static_cast<uint8_t*>(address), size);
        });
    }

    TemporaryRoot root_;
    SimUnit unit_{"client", root_.path()};
};

TEST_F(ClientUnit, CallTellsRefusedAnsweredAndUnansweredApart)
{
    struct Case {
        std::vector<std::string> arguments;
        int exit_code;
        const char* told;
    };
    const Case cases[] = {
        {{"call", "CON_delete", "null"}, 1, "= -2"},
        {{"call", "CON_getConnectionMode", kAnna}, 1, "= -1"},
        {{"call", "CON_requestConnection", "C0:00:00:00:00:09", "0", "--wait"}, 1, "result=2"},
        {{"call", "CON_requestConnection", "a0:00:00:00:00:01", "0,0x1", "--wait"}, 0, "result=0"},
        {{"call", "BT_SRV_CON_getConnectionMode", kAnna}, 0, "mode=2"},
        {{"call", "CON_queryRemoteDeviceDIDInfo", kAnna, "--wait"}, 0, "value_2=0001000200030004"},
        {{"call", "CON_getRemoteDeviceDIDInfo", kAnna, "2"}, 0, "value=\"0001000200030004\""},
        {{"call", "CON_search", "0", "--wait", "--timeout", "0.001"}, 4, "BT_SRV_CON_search = 0"},
    };
    for (const Case& example : cases) {
        const ClientRun done = run(example.arguments);
        EXPECT_EQ(done.exit_code, example.exit_code) << done.out << done.err;
        EXPECT_THAT(done.out, HasSubstr(example.told));
    }
}

TEST_F(ClientUnit, DevicesAreTheRegisteredOnes)
{
    EXPECT_TRUE(run_json({"devices"}).empty());
    ASSERT_EQ(run({"call", "CON_requestConnection", kAnna, "0", "--wait"}).exit_code, 0);

    const std::vector<json> devices = run_json({"devices"});
    ASSERT_EQ(devices.size(), 1u);
    EXPECT_EQ(devices[0]["address"], kAnna);
    EXPECT_EQ(devices[0]["name"], "Anna's phone");
    EXPECT_EQ(devices[0]["class"], "0x5A020C");
    EXPECT_EQ(devices[0]["connected_profiles"], json::array({0}));
    EXPECT_EQ(devices[0]["mode"], 2);
}

TEST_F(ClientUnit, ListenerPrintsItsEventsAndLeavesTheTable)
{
    for (const int signal : {SIGTERM, SIGINT}) {
        BackgroundClient listener(unit_.domain(), {"--json", "listen", "CON_SEARCH", "CON_CONNECTED"});
        while (status_lines("listener").empty()) {
        }
        EXPECT_EQ(run({"call", "CON_search", "0", "--wait"}).exit_code, 0);
        for (bool delivered = false; !delivered;)
            for (const json& entry : status_lines("listener"))
                delivered = delivered || entry.value("delivered", 0) == 1;

        const ClientRun ended = listener.end(signal);
        EXPECT_EQ(ended.exit_code, 0) << ended.err;
        ASSERT_EQ(ended.lines().size(), 1u) << ended.out;
        EXPECT_EQ(json::parse(ended.out)["name"], "CON_SEARCH");
        EXPECT_TRUE(status_lines("listener").empty());
    }
}

TEST_F(ClientUnit, ListenerWithACountEndsByItsCountItsTimeOrASignal)
{
    EXPECT_EQ(run({"listen", "CON_SEARCH", "--count", "1", "--timeout", "0.01"}).exit_code, 4);
    EXPECT_EQ(run({"listen", "CON_SEARCH", "--timeout", "0.01"}).exit_code, 0);

    BackgroundClient listener(unit_.domain(), {"listen", "--all-connection", "--count", "2"});
    while (status_lines("listener").empty()) {
    }
    EXPECT_EQ(listener.end(SIGTERM).exit_code, 6);
}

TEST_F(ClientUnit, ListenerNoticesThatTheUnitIsGone)
{
    BackgroundClient listener(unit_.domain(), {"listen", "--all-connection"});
    while (status_lines("listener").empty()) {
    }
    unit_.send_signal(SIGTERM);
    EXPECT_EQ(unit_.wait_for_end(), 0);
    const ClientRun ended = listener.wait();
    EXPECT_EQ(ended.exit_code, 3);
    EXPECT_THAT(ended.err, HasSubstr(unit_.domain()));
}

// The first descriptor opened in such a process would be its standard output: the unit's own memory.
TEST_F(ClientUnit, ClosedOutputIsReportedAndHarmsNothing)
{
    const ClientRun closed = run_client(unit_.domain(), {"devices"}, Output::closed);
    EXPECT_EQ(closed.exit_code, 5);
    EXPECT_THAT(closed.err, HasSubstr("standard output"));
    EXPECT_EQ(run({"devices"}).exit_code, 0);
}

TEST_F(ClientUnit, StatusSeesTheImageFile)
{
    const auto verdict = [this] { return status_lines("image").at(0)["valid"].get<bool>(); };
    EXPECT_TRUE(verdict());

    const std::string path = root_.path() + BT_CON_IMAGE_PATH;
    std::FILE* file = std::fopen(path.c_str(), "r+b");
    ASSERT_NE(file, nullptr);
    std::fseek(file, 5000, SEEK_SET);
    std::fputc(1, file);
    std::fclose(file);
    EXPECT_FALSE(verdict());

    ASSERT_EQ(truncate(path.c_str(), 19159), 0);
    EXPECT_FALSE(verdict());
    ASSERT_EQ(unlink(path.c_str()), 0);
    EXPECT_FALSE(verdict());
}

TEST_F(ClientUnit, NamesOfAnyBytesLeaveJsonValidAndTerminalsAlone)
{
    ASSERT_EQ(run({"call", "CON_requestConnection", kAnna, "0", "--wait"}).exit_code, 0);
    scribble(BT_CON_SHARE_DATA_NAME, [](uint8_t* bytes, uint32_t) {
        const uint8_t name[] = {0x1B, '[', '3', '1', 'm', 0xFF, 0xC3, '"', '\n', 0};
        auto& device = reinterpret_cast<BtConShareData*>(bytes)->registered_device_list_info.device[0];
        device.name.name_length = 0xFFFFFFFF;
        std::memcpy(device.name.name_text, name, sizeof name);
    });

    EXPECT_EQ(run_json({"devices"}).size(), 1u);
    const ClientRun text = run({"devices"});
    EXPECT_EQ(text.lines().size(), 2u);
    EXPECT_EQ(text.out.find('\x1B'), std::string::npos);
    EXPECT_THAT(text.out, HasSubstr("\\x1b[31m\\xff\\xc3\"\\x0a"));
}

TEST_F(ClientUnit, AreasOfAnyBytesAreShownWithinTheirBounds)
{
    const auto fill = [](uint8_t* bytes, uint32_t size) {
        std::mt19937 random(size);
        std::generate(bytes, bytes + size, [&random] { return static_cast<uint8_t>(random() % 4 ? random() : 0xFF); });
    };
    for (const char* name : {BT_CON_SHARE_DATA_NAME, "/tmp/shm_eds_regist_table", "btsim_unit", "btsim_distributor"})
        scribble(name, fill);

    EXPECT_LE(run_json({"devices"}).size(), 17u);
    EXPECT_LE(status_lines("service").size(), 15u);
    EXPECT_LE(status_lines("listener").size(), 50u);
    run_json({"call", "CON_getRemoteDeviceList", "0", "0", "17"});
}

} // namespace
} // namespace bt::test
