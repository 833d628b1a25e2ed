// btsvc without a unit: what it refuses, and with which exit code.
#include "client_run.h"

#include "catalogue/print.h"
#include "catalogue/rows.h"

#include <bt_service/bt_types.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <unistd.h>

namespace bt::test {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

std::string absent_domain()
{
    return "client-none-" + std::to_string(getpid());
}

TEST(Client, RefusesCommandLinesThatMakeNoSense)
{
    struct Case {
        std::vector<std::string> arguments;
        const char* told;
    };
    const Case cases[] = {
        {{}, "subcommand"},
        {{"dance"}, "\"dance\" is no command"},
        {{"devices", "now"}, "now"},
        {{"listen"}, "no event named"},
        {{"listen", "CON_NONE"}, "\"CON_NONE\" is no event"},
        {{"listen", "0x10000"}, "0..65535"},
        {{"listen", "CON_SEARCH", "--count", "0"}, "--count"},
        {{"call"}, "no function named"},
        {{"call", "con_search", "0"}, "did you mean CON_search"},
        {{"call", "CON_search"}, "1 expected: value"},
        {{"call", "CON_search", "-1"}, "argument 1 (value"},
        {{"call", "CON_search", "4294967296"}, "0..4294967295"},
        {{"call", "CON_search", "0x"}, "\"0x\""},
        {{"call", "CON_search", "12 "}, "\"12 \""},
        {{"call", "CON_delete", "11:22:33:44:55"}, "AA:BB:CC:DD:EE:FF"},
        {{"call", "CON_delete", "11:22:33:44:55:6G"}, "AA:BB:CC:DD:EE:FF"},
        {{"call", "CON_authenticatePasskey", "0", "A0:00:00:00:00:01", "010203040506070809"}, "at most 8"},
        {{"call", "CON_authenticatePasskey", "0", "A0:00:00:00:00:01", "123"}, "pairs"},
        {{"call", "CON_requestConnection", "A0:00:00:00:00:01", "0,1,2,3,4,5,6,7"}, "at most 7"},
        {{"call", "CON_requestConnection", "A0:00:00:00:00:01", "0,,1"}, "\"\""},
        {{"call", "CON_getScanMode", "--wait"}, "query"},
    };
    for (const Case& example : cases) {
        const ClientRun run = run_client(absent_domain(), example.arguments);
        EXPECT_EQ(run.exit_code, 2) << example.told;
        EXPECT_THAT(run.err, HasSubstr(example.told));
        EXPECT_THAT(run.out, IsEmpty()) << example.told;
    }
}

TEST(Client, SaysThatThereIsNoUnit)
{
    const std::vector<std::vector<std::string>> commands = {
        {"devices"}, {"status"}, {"listen", "CON_SEARCH"}, {"call", "CON_search", "0"}, {"call", "CON_getScanMode"}};
    for (const auto& arguments : commands) {
        const ClientRun run = run_client(absent_domain(), arguments);
        EXPECT_EQ(run.exit_code, 3) << arguments.front();
        EXPECT_THAT(run.err, HasSubstr(absent_domain())) << arguments.front();
        EXPECT_THAT(run.err, HasSubstr("btsvc-sim")) << arguments.front() << ": no remedy";
        EXPECT_THAT(run.out, IsEmpty()) << arguments.front();
    }
}

TEST(Client, HelpNeedsNoUnit)
{
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"--help"},
                                                      {"devices", "--help"},
                                                      {"listen", "--help"},
                                                      {"call", "--help"},
                                                      {"status", "--help"},
                                                      {"call", "--list"},
                                                      {"--version"}}) {
        const ClientRun run = run_client(absent_domain(), arguments);
        EXPECT_EQ(run.exit_code, 0) << arguments.front();
        EXPECT_THAT(run.out, Not(IsEmpty())) << arguments.front();
    }
}

TEST(Client, CallsEveryConnectionRequestOfTheCatalogue)
{
    const std::string list = run_client(absent_domain(), {"call", "--list"}).out;
    for (const catalogue::Row& request : catalogue::requests()) {
        if (request.process != PNO_BT_CON) continue;
        EXPECT_THAT(list, HasSubstr(catalogue::id_text(request.id) + "  " + request.name + " "));
    }
}

} // namespace
} // namespace bt::test
