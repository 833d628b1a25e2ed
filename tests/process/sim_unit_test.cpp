// The simulated unit as a whole: its domain, its end, its scenario, and the delivery of events.
#include "sim_unit.h"

#include <bt_platform/host.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>
#include <cstdio>
#include <fstream>
#include <memory>
#include <sys/wait.h>
#include <unistd.h>

namespace bt::test {
namespace {

const BtDevAddress kAnna = device_address(0xA0, 1);

constexpr int kDomainTaken = 3;

uint32_t disconnect_all_result()
{
    EXPECT_EQ(0, BT_SRV_CON_requestAllDisconnection(1, &kAnna));
    return word(wait_for(BT_SIM_EVENT_CON_ALL_DISCONNECTION), 0);
}

void expect_service_works()
{
    listen_for({BT_SIM_EVENT_CON_ALL_DISCONNECTION});
    EXPECT_EQ(BT_SIM_OK, disconnect_all_result());
}

TEST(SimUnit, EndLeavesNothingInSharedMemory)
{
    for (const int signal : {SIGTERM, SIGINT}) {
        TemporaryRoot root;
        SimUnit unit("sim-end", root.path());
        ASSERT_TRUE(unit.ready());
        EXPECT_THAT(objects_of(unit.domain()), testing::Not(testing::IsEmpty()));
        as_application(unit.domain(), expect_service_works);
        unit.send_signal(signal);
        EXPECT_EQ(0, unit.wait_for_end());
        EXPECT_THAT(objects_of(unit.domain()), testing::IsEmpty());
    }
}

TEST(SimUnit, UnitsInTwoDomainsDoNotSeeEachOther)
{
    TemporaryRoot root_a;
    TemporaryRoot root_b;
    SimUnit a("sim-a", root_a.path());
    SimUnit b("sim-b", root_b.path());
    ASSERT_TRUE(a.ready() && b.ready());
    as_application(a.domain(), [] {
        const BtConParameters parameters = {0, {}};
        listen_for({BT_SIM_EVENT_CON_CONNECTION});
        ASSERT_EQ(0, BT_SRV_CON_requestConnection(&kAnna, &parameters));
        EXPECT_EQ(BT_SIM_OK, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0));
    });
    for (const auto& [unit, registered] : {std::pair<const SimUnit*, int32_t>{&a, 0}, {&b, -1}}) {
        as_application(unit->domain(), [registered = registered] {
            uint32_t mode = 0;
            EXPECT_EQ(registered, BT_SRV_CON_getConnectionMode(&kAnna, &mode));
        });
    }
}

TEST(SimUnit, DomainOfALiveUnitIsRefused)
{
    TemporaryRoot root;
    SimUnit first("sim-taken", root.path());
    ASSERT_TRUE(first.ready());
    SimUnit second("sim-taken", root.path());
    EXPECT_FALSE(second.ready());
    EXPECT_EQ(kDomainTaken, second.wait_for_end());
    as_application(first.domain(), expect_service_works);
}

TEST(SimUnit, DomainOfADeadUnitIsTakenOver)
{
    TemporaryRoot root;
    SimUnit dead("sim-dead", root.path());
    ASSERT_TRUE(dead.ready());
    dead.send_signal(SIGKILL);
    EXPECT_EQ(-SIGKILL, dead.wait_for_end());
    SimUnit next("sim-dead", root.path());
    ASSERT_TRUE(next.ready());
    as_application(next.domain(), expect_service_works);
}

TEST(SimUnit, ApplicationThatOutlivesItsUnitGoesOnWithTheNextOne)
{
    TemporaryRoot root;
    SimUnit dead("sim-outlived", root.path());
    ASSERT_TRUE(dead.ready());
    as_application(dead.domain(), [&] {
        expect_service_works();
        dead.send_signal(SIGKILL);
        // The domain is taken until the kernel has removed the dead unit.
        auto next = std::make_unique<SimUnit>("sim-outlived", root.path());
        while (!next->ready() && next->wait_for_end() == kDomainTaken)
            next = std::make_unique<SimUnit>("sim-outlived", root.path());
        ASSERT_TRUE(next->ready());
        expect_service_works();
    });
}

TEST(SimUnit, SuspendedListenerGetsNothingUntilItIsResumed)
{
    TemporaryRoot root;
    SimUnit unit("sim-suspend", root.path());
    ASSERT_TRUE(unit.ready());
    as_application(unit.domain(), [] {
        const uint32_t searches = listen_for({BT_SIM_EVENT_CON_CANCEL_SEARCH});
        listen_for({BT_SIM_EVENT_CON_ALL_DISCONNECTION});
        BT_SRV_EvtSrv_suspend(searches);
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        ASSERT_EQ(0, BT_SRV_CON_requestAllDisconnection(1, &kAnna));
        EXPECT_EQ(BT_SIM_EVENT_CON_ALL_DISCONNECTION, next_event().msg_header.hdr.cid);
        BT_SRV_EvtSrv_resume(searches);
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        EXPECT_EQ(BT_SIM_EVENT_CON_CANCEL_SEARCH, next_event().msg_header.hdr.cid);
    });
}

const BtSimListenerCount& count_of(uint32_t handle)
{
    static const BtSimListenerCount none{};
    void* address = nullptr;
    uint32_t size = sizeof(BtSimDistributor);
    EXPECT_EQ(0, _sys_LinkShareData(kDistributorDataName, &address, &size));
    for (const BtSimListenerCount& count : static_cast<const BtSimDistributor*>(address)->listeners)
        if (count.handle == handle) return count;
    return none;
}

// One listener never takes its events, one does not exist, one would hand every event back: those who listen behind
// them in the table miss none.
TEST(SimUnit, BrokenListenersDelayNobody)
{
    TemporaryRoot root;
    SimUnit unit("sim-broken", root.path());
    ASSERT_TRUE(unit.ready());
    int full[2];
    int done[2];
    ASSERT_TRUE(pipe(full) == 0 && pipe(done) == 0);
    const pid_t lazy = fork();
    if (lazy == 0) {
        close(done[1]);
        as_application(unit.domain(), [&] {
            const uint32_t handle = listen_for({BT_SIM_EVENT_CON_CANCEL_SEARCH});
            ASSERT_EQ(4, write(full[1], &handle, sizeof handle));
            char end = 0;
            EXPECT_EQ(0, read(done[0], &end, 1)) << "the other side closes when it is done";
        });
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    close(done[0]);
    uint32_t lazy_handle = 0;
    ASSERT_EQ(4, read(full[0], &lazy_handle, sizeof lazy_handle));

    as_application(unit.domain(), [&] {
        const uint32_t wanted = BT_SIM_EVENT_CON_CANCEL_SEARCH;
        const uint32_t gone = BT_SRV_EvtSrv_regist(0x7777, 0, 1, &wanted);
        const uint32_t circle = BT_SRV_EvtSrv_regist(PNO_BT_EDS, 0, 1, &wanted);
        const uint32_t mine = listen_for({wanted});
        while (count_of(lazy_handle).full < 20) {
            ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
            ASSERT_EQ(wanted, next_event().msg_header.hdr.cid);
        }
        EXPECT_EQ(0U, count_of(mine).full + count_of(mine).failed + count_of(mine).gone);
        EXPECT_EQ(0U, count_of(circle).delivered);
        EXPECT_EQ(nullptr, find_HdlList(gone)) << "nobody owns its number, so it loses its registration";
        EXPECT_NE(nullptr, find_HdlList(lazy_handle)) << "its process lives";
    });
    close(done[1]);
    int status = 0;
    ASSERT_EQ(lazy, waitpid(lazy, &status, 0));
    EXPECT_EQ(0, status);
}

struct BadScenario {
    const char* text;
    const char* complaint; // the place in the file, and part of the remedy
};

// What a scenario looks like around a phone.
#define PHONE(fields)                                                                                                   \
    R"({"local":{"name":"u","address":"00:00:00:00:00:01"},"phones":[{"name":"p","address":"A0:00:00:00:00:01")" fields \
    "}]}"

TEST(SimScenario, WrongFileIsRefusedWithPlaceAndRemedy)
{
    const BadScenario rows[] = {
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
    TemporaryRoot root;
    const std::string file = root.path() + "/scenario.json";
    for (const BadScenario& row : rows) {
        SCOPED_TRACE(row.text);
        std::ofstream(file) << row.text;
        FILE* const output = popen((sim_path() + " --check --scenario " + file + " 2>&1").c_str(), "r");
        ASSERT_NE(nullptr, output);
        char line[1024] = {};
        EXPECT_NE(nullptr, fgets(line, sizeof line, output));
        EXPECT_EQ(2, WEXITSTATUS(pclose(output)));
        EXPECT_THAT(line, testing::ContainsRegex(file + ": .*" + row.complaint));
    }
}

} // namespace
} // namespace bt::test
