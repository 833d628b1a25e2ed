// btsvc: what it refuses without a unit; against a running one its answers, its JSON, its exit codes, and bytes of any
// kind in the shared areas.
#include "sim_unit.h"

#include "catalogue/print.h"
#include "catalogue/rows.h"

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include <fstream>
#include <random>
#include <sstream>

namespace bt::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

Program btsvc(const std::string& domain, const std::string& arguments)
{
    return Program("'" BTSVC_PATH "' --domain " + domain + " " + arguments);
}

struct Case {
    const char* line;
    int exit_code;
    const char* told;
};

TEST(Client, RefusesCommandLinesThatMakeNoSenseAndUnitsThatAreNotThere)
{
    const Case cases[] = {
        {"", 2, "subcommand"},
        {"dance", 2, "\"dance\" is no command"},
        {"devices now", 2, "now"},
        {"listen", 2, "no event named"},
        {"listen CON_NONE", 2, "\"CON_NONE\" is no event"},
        {"listen 0x10000", 2, "0..65535"},
        {"listen CON_SEARCH --count 0", 2, "--count"},
        {"call", 2, "no function named"},
        {"call con_search 0", 2, "did you mean CON_search"},
        {"call CON_search", 2, "1 expected: value"},
        {"call CON_search -1", 2, "argument 1 (value"},
        {"call CON_search 4294967296", 2, "0..4294967295"},
        {"call CON_search 0x", 2, "\"0x\""},
        {"call CON_search 12x", 2, "\"12x\""},
        {"call CON_delete 11:22:33:44:55", 2, "AA:BB:CC:DD:EE:FF"},
        {"call CON_delete 11:22:33:44:55:6G", 2, "AA:BB:CC:DD:EE:FF"},
        {"call CON_delete 112233445566", 2, "AA:BB:CC:DD:EE:FF"},
        {"call CON_authenticatePasskey 0 A0:00:00:00:00:01 010203040506070809", 2, "at most 8"},
        {"call CON_authenticatePasskey 0 A0:00:00:00:00:01 123", 2, "pairs"},
        {"call CON_requestConnection A0:00:00:00:00:01 0,1,2,3,4,5,6,7", 2, "at most 7"},
        {"call CON_requestConnection A0:00:00:00:00:01 0,,1", 2, "\"\""},
        {"call CON_getScanMode --wait", 2, "query"},
        {"devices", 3, "\"none\""},
        {"status", 3, "\"none\""},
        {"listen CON_SEARCH", 3, "`btsvc-sim` starts a simulated unit"},
        {"call CON_search 0", 3, "\"none\""},
        {"call CON_getScanMode", 3, "\"none\""},
        {"--help", 0, "Exit codes: 0 done"},
        {"call --help", 0, "Exit code 1 means"},
        {"--version", 0, "1."},
    };
    for (const Case& row : cases) {
        const Ended run = btsvc("none", row.line).end();
        EXPECT_EQ(run.code, row.exit_code) << row.line;
        EXPECT_THAT(row.exit_code == 0 ? run.out : run.err, HasSubstr(row.told));
        EXPECT_EQ(run.out.empty(), row.exit_code != 0) << row.line;
    }
}

TEST(Client, CallsEveryConnectionRequestOfTheCatalogue)
{
    const std::string list = btsvc("none", "call --list").end().out;
    for (const catalogue::Row& request : catalogue::requests()) {
        if (request.process != PNO_BT_CON) continue;
        EXPECT_THAT(list, HasSubstr(catalogue::id_text(request.id) + "  " + request.name + " "));
    }
}

class ClientUnit : public testing::Test {
protected:
    void SetUp() override { ASSERT_TRUE(unit.ready); }

    Ended run(const std::string& line) const { return btsvc(unit.domain, line).end(); }

    // Every line must be one JSON object of this version; those of the type are returned.
    std::vector<json> run_json(const std::string& line, const std::string& type) const
    {
        const Ended done = run("--json " + line);
        EXPECT_EQ(done.code, 0) << done.err;
        std::istringstream lines(done.out);
        std::vector<json> objects;
        for (std::string text; std::getline(lines, text);) {
            const json object = json::parse(text, nullptr, false);
            EXPECT_TRUE(object.is_object() && object.value("version", 0) == 1) << text;
            if (object.is_object() && object.value("type", "") == type) objects.push_back(object);
        }
        return objects;
    }

    std::vector<json> listeners() const { return run_json("status", "listener"); }

    // Overwrites shared data of the unit with what `change` makes of its bytes.
    void scribble(const char* name, void (*change)(uint8_t* bytes, uint32_t size)) const
    {
        as_application(unit.domain, [name, change] {
            uint32_t size = 0;
            auto* const bytes = static_cast<uint8_t*>(link_data(name, &size));
            change(bytes, size);
        });
    }

    Unit unit{"client"};
};

TEST_F(ClientUnit, ExitCodesTellRefusedAnsweredUnansweredAndUnprintedApart)
{
    const Case cases[] = {
        {"call CON_delete null", 1, "= -2"},
        {"call CON_getConnectionMode A0:00:00:00:00:01", 1, "= -1"},
        {"call CON_requestConnection C0:00:00:00:00:09 0 --wait", 1, "result=2"},
        {"call CON_requestConnection a0:00:00:00:00:01 0,0x1 --wait", 0, "result=0"},
        {"call BT_SRV_CON_getConnectionMode A0:00:00:00:00:01", 0, "mode=2"},
        {"call CON_queryRemoteDeviceDIDInfo A0:00:00:00:00:01 --wait", 0, "value_2=0001000200030004"},
        {"call CON_getRemoteDeviceDIDInfo A0:00:00:00:00:01 2", 0, "value=\"0001000200030004\""},
        {"call CON_search 0 --wait --timeout 0.001", 4, "BT_SRV_CON_search = 0"},
        {"devices >&-", 5, "standard output"}, // not written into the unit's memory, the first descriptor opened then
        {"devices", 0, "Anna's phone"},
    };
    for (const Case& row : cases) {
        const Ended done = run(row.line);
        EXPECT_EQ(done.code, row.exit_code) << done.out << done.err;
        EXPECT_THAT(done.out + done.err, HasSubstr(row.told));
    }
}

TEST_F(ClientUnit, DevicesAreTheRegisteredOnesAndTheirNamesLeaveJsonValidAndTerminalsAlone)
{
    EXPECT_TRUE(run_json("devices", "device").empty());
    ASSERT_EQ(run("call CON_requestConnection A0:00:00:00:00:01 0 --wait").code, 0);
    const std::vector<json> devices = run_json("devices", "device");
    ASSERT_EQ(devices.size(), 1u);
    EXPECT_EQ(devices[0], json::parse(R"({"version":1,"type":"device","slot":0,"address":"A0:00:00:00:00:01",
        "class":"0x5A020C","name":"Anna's phone","char_set":106,"supported_profiles":[0,1,3,5,8],"connected_profiles":[0],
        "mode":2,"role":1,"attribute":0})"));

    scribble(BT_CON_SHARE_DATA_NAME, [](uint8_t* bytes, uint32_t) {
        auto& name = reinterpret_cast<BtConShareData*>(bytes)->registered_device_list_info.device[0].name;
        name.name_length = 0xFFFFFFFF;
        std::memcpy(name.name_text, "\x1B[31m\xFF\xC3\"\n", 10);
    });
    EXPECT_EQ(run_json("devices", "device").size(), 1u);
    const std::string text = run("devices").out;
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 2);
    EXPECT_THAT(text, testing::AllOf(testing::Not(HasSubstr("\x1B")), HasSubstr("\\x1b[31m\\xff\\xc3\"\\x0a")));
}

TEST_F(ClientUnit, FirstProgramOfTheReadmeConnectsAPhoneAndListsIt)
{
    const Ended done = Program("env BT_PLATFORM_DOMAIN=" + unit.domain + " '" FIRST_PROGRAM_PATH "'").end();
    EXPECT_EQ(done.code, 0) << done.err;
    EXPECT_EQ(done.out, "answer 0xA881, result 0\ndevice 0: Anna's phone\n");
}

TEST_F(ClientUnit, ListenerPrintsItsEventsAndLeavesTheTableWhenItIsToldToEnd)
{
    const std::tuple<const char*, int, int> rows[] = {{"CON_SEARCH CON_CONNECTED", SIGTERM, 0},
                                                      {"CON_SEARCH --timeout 1000", SIGINT, 0},
                                                      {"--all-connection --count 20", SIGTERM, 6}};
    for (const auto& [events, signal, exit_code] : rows) {
        Program listener = btsvc(unit.domain, std::string("--json listen ") + events);
        while (listeners().empty()) {
        }
        EXPECT_EQ(run("call CON_search 0 --wait").code, 0);
        while (listeners().at(0).value("delivered", 0) == 0) {
        }
        const Ended ended = listener.end(signal);
        EXPECT_EQ(ended.code, exit_code) << ended.err;
        EXPECT_THAT(ended.out, HasSubstr("\"name\":\"CON_SEARCH\"")) << events;
        EXPECT_TRUE(listeners().empty());
    }
}

TEST_F(ClientUnit, ListenerEndsByItsTimeOrWithTheUnit)
{
    EXPECT_EQ(run("listen CON_SEARCH --count 1 --timeout 0.01").code, 4);
    EXPECT_EQ(run("listen CON_SEARCH --timeout 0.01").code, 0);
    Program listener = btsvc(unit.domain, "listen --all-connection");
    while (listeners().empty()) {
    }
    EXPECT_EQ(unit.process.end(SIGTERM), 0);
    const Ended ended = listener.end();
    EXPECT_EQ(ended.code, 3);
    EXPECT_THAT(ended.err, HasSubstr(unit.domain));
}

TEST_F(ClientUnit, StatusSeesTheImageFile)
{
    const auto is_valid = [this] { return run_json("status", "image").at(0)["valid"].get<bool>(); };
    EXPECT_TRUE(is_valid());
    const std::string path = unit.root + BT_CON_IMAGE_PATH;
    std::fstream(path, std::ios::in | std::ios::out).seekp(5000).put(1);
    EXPECT_FALSE(is_valid());
    std::filesystem::resize_file(path, 19159);
    EXPECT_FALSE(is_valid());
    std::filesystem::remove(path);
    EXPECT_FALSE(is_valid());
}

TEST_F(ClientUnit, AreasOfAnyBytesAreShownWithinTheirBounds)
{
    const auto fill = [](uint8_t* bytes, uint32_t size) {
        std::mt19937 random(size);
        std::generate(bytes, bytes + size, [&random] { return static_cast<uint8_t>(random() % 4 ? random() : 0xFF); });
    };
    for (const char* name : {BT_CON_SHARE_DATA_NAME, "/tmp/shm_eds_regist_table", "btsim_unit", "btsim_distributor"})
        scribble(name, fill);

    EXPECT_LE(run_json("devices", "device").size(), 17u);
    EXPECT_LE(run_json("status", "service").size(), 15u);
    EXPECT_LE(listeners().size(), 50u);
    EXPECT_EQ(run("--json call CON_getRemoteDeviceList 0 0 17").code, 0);
}

} // namespace
} // namespace bt::test
