// The simulated unit as a whole: its domain, its end, its scenario, and the delivery of events.
#include "sim_unit.h"

#include <gmock/gmock.h>

#include <fstream>
#include <regex>

namespace bt::test {
namespace {

constexpr uint32_t kCancelled = BT_SIM_EVENT_CON_CANCEL_SEARCH;
constexpr uint32_t kDisconnected = BT_SIM_EVENT_CON_ALL_DISCONNECTION;

void expect_service_works()
{
    listen_for({kDisconnected});
    EXPECT_ANSWER(requestAllDisconnection(1, &kAnna), ALL_DISCONNECTION, 0, BT_SIM_OK);
}

std::vector<std::string> objects_of(const std::string& domain)
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator("/dev/shm"))
        if (entry.path().string().find(domain) != std::string::npos) names.push_back(entry.path());
    return names;
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
    const auto expect_registered = [](const Unit& unit, int32_t result) {
        as_application(unit.domain, [result] {
            uint32_t mode = 0;
            EXPECT_EQ(result, BT_SRV_CON_getConnectionMode(&kAnna, &mode));
        });
    };
    expect_registered(a, 0);
    expect_registered(b, -1);
    for (auto& [unit, signal] : {std::pair<Unit&, int>{a, SIGTERM}, {b, SIGINT}}) {
        as_application(unit.domain, expect_service_works);
        EXPECT_THAT(objects_of(unit.domain), testing::Not(testing::IsEmpty()));
        EXPECT_EQ(0, unit.process.end(signal));
        EXPECT_THAT(objects_of(unit.domain), testing::IsEmpty());
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

TEST(SimUnit, SuspendedListenerGetsNothingUntilItIsResumed)
{
    const Unit unit("sim-suspend");
    ASSERT_TRUE(unit.ready);
    as_application(unit.domain, [] {
        const uint32_t searches = listen_for({kCancelled});
        listen_for({kDisconnected});
        BT_SRV_EvtSrv_suspend(searches);
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        ASSERT_EQ(0, BT_SRV_CON_requestAllDisconnection(1, &kAnna));
        EXPECT_EQ(kDisconnected, next_event().msg_header.hdr.cid);
        BT_SRV_EvtSrv_resume(searches);
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        EXPECT_EQ(kCancelled, next_event().msg_header.hdr.cid);
    });
}

const BtSimListenerCount& count_of(uint32_t handle)
{
    const auto& counts = record_of_unit<BtSimDistributor>(kDistributorDataName).listeners;
    return *std::find_if(std::begin(counts), std::end(counts) - 1, [=](auto& count) { return count.handle == handle; });
}

// One listener never takes its events, one does not exist, one would hand every event back: those who listen behind
// them in the table miss none.
TEST(SimUnit, BrokenListenersDelayNobody)
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
        const auto& first = record_of_unit<BtSimDistributor>(kDistributorDataName).listeners[0];
        const uint32_t gone = BT_SRV_EvtSrv_regist(0x7777, 0, 1, &kCancelled);
        const uint32_t circle = BT_SRV_EvtSrv_regist(PNO_BT_EDS, 0, 1, &kCancelled);
        const uint32_t mine = listen_for({kCancelled});
        while (first.full < 20) {
            ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
            ASSERT_EQ(kCancelled, next_event().msg_header.hdr.cid);
        }
        EXPECT_EQ(0U, count_of(mine).full + count_of(mine).failed + count_of(mine).gone);
        EXPECT_EQ(0U, count_of(circle).delivered);
        EXPECT_EQ(nullptr, find_HdlList(gone)) << "nobody owns its number, so it loses its registration";
        EXPECT_NE(nullptr, find_HdlList(first.handle)) << "its process lives";
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
