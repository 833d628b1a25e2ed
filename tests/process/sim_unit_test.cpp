// The simulated unit as a whole: its domain, its end, its scenario, and the delivery of events.
#include "sim_unit.h"

#include <gmock/gmock.h>

#include <fstream>
#include <regex>

namespace bt::test {
namespace {

constexpr uint32_t kCancelled = BT_SIM_EVENT_CON_CANCEL_SEARCH;

void expect_service_works()
{
    listen_for({BT_SIM_EVENT_CON_ALL_DISCONNECTION});
    EXPECT_ANSWER(requestAllDisconnection(1, &kAnna), ALL_DISCONNECTION, 0, BT_SIM_OK);
}

bool has_objects(const std::string& domain)
{
    const std::filesystem::directory_iterator all("/dev/shm");
    return std::any_of(begin(all), end(all),
                       [&](auto& entry) { return entry.path().string().find(domain) != std::string::npos; });
}

TEST(SimUnit, UnitsInTwoDomainsDoNotSeeEachOtherAndLeaveNothingInSharedMemory)
{
    Unit a("sim-a");
    Unit b("sim-b");
    ASSERT_TRUE(a.ready && b.ready);
    as_application(a.domain, [] {
        const BtConParameters parameters = {0, {}};
        listen_for({BT_SIM_EVENT_CON_CONNECTION});
        EXPECT_ANSWER(requestConnection(&kAnna, &parameters), CONNECTION, 0, BT_SIM_OK);
    });
    for (auto& [unit, registered, signal] : {std::tuple<Unit&, int32_t, int>{a, 0, SIGTERM}, {b, -1, SIGINT}}) {
        as_application(unit.domain, [registered = registered] {
            uint32_t mode = 0;
            EXPECT_EQ(registered, BT_SRV_CON_getConnectionMode(&kAnna, &mode));
            expect_service_works();
        });
        EXPECT_TRUE(has_objects(unit.domain));
        EXPECT_EQ(0, unit.process.end(signal));
        EXPECT_FALSE(has_objects(unit.domain));
    }
}

TEST(SimUnit, DomainIsTakenOverFromADeadUnitOnlyAndItsApplicationsGoOn)
{
    Unit first("sim-taken");
    ASSERT_TRUE(first.ready);
    Unit second("sim-taken");
    EXPECT_FALSE(second.ready);
    EXPECT_EQ(3, second.process.end());

    Child application([&] {
        be_application(first.domain, [] {
            expect_service_works();
            stand();
            expect_service_works();
        });
    });
    hear(application.line);
    first.process.end(SIGKILL);
    const Unit next("sim-taken");
    ASSERT_TRUE(next.ready);
    say(application.line);
    EXPECT_EQ(application.end(), 0);
}

// One listener never takes its events, one does not exist, one would hand every event back, one is suspended: those who
// listen behind them in the table miss none.
TEST(SimUnit, BrokenAndSuspendedListenersDelayNobody)
{
    const Unit unit("sim-broken");
    ASSERT_TRUE(unit.ready);
    Child lazy([&] {
        be_application(unit.domain, [] {
            listen_for({kCancelled});
            stand();
        });
    });
    hear(lazy.line);
    as_application(unit.domain, [] {
        const uint32_t gone = BT_SRV_EvtSrv_regist(0x7777, 0, 1, &kCancelled);
        BT_SRV_EvtSrv_regist(PNO_BT_EDS, 0, 1, &kCancelled);
        const uint32_t suspended = listen_for({kCancelled});
        BT_SRV_EvtSrv_suspend(suspended);
        listen_for({kCancelled});
        const auto& counts = static_cast<const BtSimDistributor*>(link_data(kDistributorDataName))->listeners;
        while (counts[0].full < 20) {
            ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
            ASSERT_EQ(kCancelled, next_event().msg_header.hdr.cid);
        }
        EXPECT_EQ(counts[4].pno, _sys_GetPno());
        EXPECT_EQ(counts[4].full + counts[4].failed + counts[4].gone, 0U);
        EXPECT_EQ(counts[2].delivered + counts[3].delivered, 0U);
        EXPECT_EQ(nullptr, find_HdlList(gone)) << "nobody owns its number, so it loses its registration";
        EXPECT_NE(nullptr, find_HdlList(counts[0].handle)) << "its process lives";
        BT_SRV_EvtSrv_resume(suspended);
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        for (int registrations = 2; registrations > 0; --registrations)
            EXPECT_EQ(kCancelled, next_event().msg_header.hdr.cid);
    });
    say(lazy.line);
    EXPECT_EQ(lazy.end(), 0);
}

TEST(SimScenario, WrongFileIsRefusedWithPlaceAndRemedy)
{
// What a scenario looks like around a phone.
#define PHONE(fields)                                                                                                   \
    R"({"local":{"name":"u","address":"00:00:00:00:00:01"},"phones":[{"name":"p","address":"A0:00:00:00:00:01")" fields \
    "}]}"
    const std::pair<const char*, const char*> rows[] = {
        {"", "is not JSON"},
        {"[]", "/: is array; write an object"},
        {"{}", "/local/name: is missing"},
        {R"({"local":{"name":"u","address":"00:00:00:00:00"}})", "/local/address: .*AA:BB:CC:DD:EE:FF"},
        {R"({"local":{"name":"u","address":"FF:FF:FF:FF:FF:FF"}})", "/local/address: means no device"},
        {R"({"local":{"name":"u","address":"00:00:00:00:00:01","mood":1}})", "/local/mood: .*reply_timeout_ms"},
        {PHONE(R"(,"profiles":[0,9])"), "/phones/0/profiles/1: is 9; .*0 to 8"},
        {PHONE(R"(,"profiles":3)"), "/phones/0/profiles: is number; write a list"},
        {PHONE(R"(,"mode":18446744073709551615)"), "/phones/0/mode: .*0 to 4294967295"},
        {PHONE(R"(,"mode":1.5)"), "/phones/0/mode: is 1.5"},
        {PHONE(R"(,"in_range":"no")"), "/phones/0/in_range: .*true or false"},
        {PHONE(R"(,"pairing":{"method":"magic"})"), "/phones/0/pairing/method: .*just_works"},
        {PHONE(R"(,"pairing":{"method":"pin"})"), "/phones/0/pairing/pin: is missing"},
        {PHONE(R"(,"pairing":{"pin":"1234"})"), "/phones/0/pairing/pin: is not a key"},
        {PHONE(R"(,"device_id":[{"key":0,"value":"0000000000000000"}])"), "/phones/0/device_id/0/key: "},
        {PHONE(R"(,"device_id":[{"key":1,"value":"00"}])"), "/phones/0/device_id/0/value: .*16 hex digits"},
        {PHONE(R"(,"services":["11"])"), "/phones/0/services: .*4, 8 or 32"},
        {PHONE(R"(},{"name":"q","address":"a0:00:00:00:00:01")"), "/phones/1/address: .*earlier phone"},
    };
    const std::string file = testing::TempDir() + "scenario-" + std::to_string(getpid()) + ".json";
    for (const auto& [text, complaint] : rows) {
        std::ofstream(file) << text;
        const Ended check = Program("'" BTSVC_SIM_PATH "' --check --scenario " + file).end();
        EXPECT_EQ(2, check.code) << text;
        EXPECT_TRUE(std::regex_search(check.err, std::regex(file + ": .*" + complaint))) << text << "\n" << check.err;
    }
    std::filesystem::remove(file);
}

} // namespace
} // namespace bt::test
