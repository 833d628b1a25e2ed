// The state machine engine: order of exit and entry functions, the searches, and every line they log.
#include "log_capture.h"

#include <bt_service/bt_message.h>
#include <bt_service/bt_state_machine.h>
#include <gmock/gmock.h>

namespace {

std::string g_run; // "-A+B": the exit function of A, then the entry function of B
uint32_t g_current;
std::vector<uint32_t> g_state_seen;

template <char Sign, char Name>
void step()
{
    g_run += {Sign, Name};
    g_state_seen.push_back(g_current);
}

template <char Name>
BtStateRow state(uint32_t number, const BtStateRow* parent)
{
    return {number, step<'+', Name>, step<'-', Name>, parent};
}

// R holds P and Q; A, B are in P; C is in Q; S and T stand alone.
enum : uint32_t { kA = 1, kB, kC, kP, kQ, kR, kS, kT = 0x1FFFF, kUnknown = 0x99 };
const BtStateRow kEnd = {0xFFFF, nullptr, nullptr, nullptr};
const BtStateRow kTop = state<'R'>(kR, nullptr), kOfP = state<'P'>(kP, &kTop), kOfQ = state<'Q'>(kQ, &kTop);
const BtStateRow kStates[] = {state<'A'>(kA, &kOfP),
                              state<'B'>(kB, &kOfP),
                              state<'C'>(kC, &kOfQ),
                              state<'P'>(kP, &kTop),
                              state<'S'>(kS, nullptr),
                              state<'T'>(kT, nullptr),
                              kEnd};

TEST(StateChange, RunsExitsUpwardsThenEntriesDownwards)
{
    const struct {
        uint32_t from, to;
        int32_t result;
        const char* run;
        uint32_t after;
    } rows[] = {
        {kS, kT, 0, "-S+T", kT},
        {kA, kB, 0, "-A+B", kB},
        {kA, kC, 0, "-A-P-R+R+Q+C", kC},
        {kA, kP, 0, "-A-P-R+R+P", kP},
        {kP, kA, 0, "-P-R+R+P+A", kA},
        {kS, kC, 0, "-S+R+Q+C", kC},
        {kA, kA, 1, "", kA},
        {kUnknown, kA, 1, "", kUnknown},
        {kS, kUnknown, 1, "-S", kS}, // no row, so no parent: the same as S has
        {kA, kUnknown, 1, "-A-P-R", kA},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.from) + "->" + std::to_string(row.to));
        g_run.clear();
        g_state_seen.clear();
        g_current = row.from;
        EXPECT_EQ(BT_CMN_changeStatus(&g_current, row.to, kStates), row.result);
        EXPECT_EQ(g_run, row.run);
        EXPECT_EQ(g_current, row.after);
        EXPECT_THAT(g_state_seen, testing::Each(row.from)) << "the old state stands while they run";
    }
}

TEST(StateChange, DuplicateRowsAllRunAndTheLastParentCounts)
{
    const BtStateRow rows[] = {state<'1'>(kA, &kOfP), state<'2'>(kA, nullptr), state<'3'>(kB, nullptr),
                               state<'4'>(kB, nullptr), kEnd};
    g_run.clear();
    g_current = kA;
    EXPECT_EQ(BT_CMN_changeStatus(&g_current, kB, rows), 0);
    EXPECT_EQ(g_run, "-1-2+3+4");
}

TEST(StateChange, LogsEachStep)
{
    const std::string start = "[API][START] BT_CMN_changeStatus", place = "[api:BT_CMN_changeStatus] ",
                      end = "[API][END] BT_CMN_changeStatus ";
    const auto expect = [](uint32_t* current, uint32_t next, const BtStateRow* table, const Lines& lines) {
        EXPECT_EQ(logged("CMN", [&] { BT_CMN_changeStatus(current, next, table); }), lines);
    };
    uint32_t a = kA, s = kS, t = kT, unknown = kUnknown;
    expect(nullptr, kB, kStates,
           {start, place + "param err. current_state = (nil), state_table = " + pointer_text(kStates), end + "(1)"});
    expect(&a, kB, nullptr,
           {start, place + "param err. current_state = " + pointer_text(&a) + ", state_table = (nil)", end + "(1)"});
    expect(&a, kA, kStates, {start, place + "param err. current_state = 0x0001, next_state = 0x0001", end + "(1)"});
    expect(&a, kB, &kEnd, {start, place + "param err. current_state = 0x0001, tmp_state = 0xffff", place + "ret = 1"});
    expect(&unknown, kB, kStates,
           {start, place + "param err. current_state = 0x0099, tmp_state = 0xffff", place + "ret = 1"});
    expect(&t, kUnknown, kStates, {start, end + "(1)"});
    expect(
        &s, kP, kStates,
        {start, "[API][MODEL] bt_cmn_changeStatusExit",
         "[model:bt_cmn_changeStatusExit] done state( 0007 ) exit func. ", "[API][MODEL] bt_cmn_changeStatusExit ",
         "[API][MODEL] bt_cmn_changeStatusEntry", "[model:bt_cmn_changeStatusEntry] state( 0004 ) has parent state. ",
         "[API][MODEL] bt_cmn_changeStatusEntry", "[model:bt_cmn_changeStatusEntry] done state( 0006 ) entry func. ",
         "[API][MODEL] bt_cmn_changeStatusEntry ", "[model:bt_cmn_changeStatusEntry] done state( 0004 ) entry func. ",
         "[API][MODEL] bt_cmn_changeStatusEntry ", end + "(0)"});
    EXPECT_EQ(logged("CMN", [] { bt_cmn_changeStatusExit(&kOfP); })[2],
              "[model:bt_cmn_changeStatusExit] state( 0004 ) has parent state. ");
    EXPECT_EQ(logged("CMN", [] { bt_cmn_changeStatusExit(nullptr); }),
              (Lines{"[API][MODEL] bt_cmn_changeStatusExit",
                     "[model:bt_cmn_changeStatusExit] param err. state_table = (nil) ",
                     "[API][MODEL] bt_cmn_changeStatusExit "}));
    EXPECT_EQ(logged("CMN", [] { bt_cmn_changeStatusEntry(nullptr); }),
              (Lines{"[API][MODEL] bt_cmn_changeStatusEntry",
                     "[model:bt_cmn_changeStatusEntry] param err. state_table = (nil) ",
                     "[API][MODEL] bt_cmn_changeStatusEntry "}));
}

// ---- event handling

void* g_message_seen;
std::vector<int> g_actions;
template <int Number, uint32_t Result>
uint32_t action(void* message)
{
    g_message_seen = message;
    g_actions.push_back(Number);
    return Result;
}
template <uint32_t State>
uint32_t current()
{
    return State;
}

const BtMatrixRow kFirstMatrix[] = {
    {1, 0x10, action<1, 0>}, {1, 0x10, action<2, 5>}, // never reached: the first row counts
    {1, 0x11, action<3, 7>}, {1, 0x12, nullptr},      {1, 0x13, BT_CMN_errMtxFunc},
    {2, 0x14, action<4, 0>}, {0xFFFF, 0, nullptr}};
const BtMatrixRow kSecondMatrix[] = {{2, 0x11, action<5, 9>}, {2, 0x16, action<6, 0>}, {0xFFFF, 0, nullptr}};
const BtFunctionIdRow kMachines[] = {
    {1, current<1>, kFirstMatrix}, {2, current<2>, kSecondMatrix},        {3, nullptr, kFirstMatrix},
    {4, current<1>, nullptr},      {5, BT_CMN_nopGetState, kFirstMatrix}, {1, current<2>, nullptr},
    {0xFFFF, nullptr, nullptr}};
const BtDispatchRow kDispatch[] = {{0x10, 1}, {0x11, 1}, {0x11, 2}, {0x12, 1}, {0x13, 1}, {0x14, 1},
                                   {0x15, 9}, {0x16, 2}, {0x16, 1}, {0x17, 3}, {0x19, 5}, {0xFFFF, 0}};

BtMessage message_with(uint16_t cid)
{
    BtMessage message{};
    message.msg_header.hdr.cid = cid;
    return message;
}

TEST(EventHandling, FindsTheActionOfEveryMachineThatWantsTheEvent)
{
    const struct {
        uint16_t cid;
        uint32_t result;
        std::vector<int> actions;
        std::string line; // one of those logged
    } rows[] = {
        {0x10, 0, {1}, "[API][END] BT_CMN_doMtxFunc (0)"},
        {0x11, 9, {3, 5}, "[API][END] BT_CMN_doMtxFunc (9)"}, // two machines, in table order; the second one's result
        {0x12, 1, {}, "[model:bt_cmn_searchMtxTable] param err. func = (nil) "},
        {0x13, 1, {}, "[api:BT_CMN_errMtxFunc] event id = 0013 "}, // not accepted in this state
        {0x14, 1, {}, "When EVENT recieved , current_state is 1 "}, // another state's row
        {0x15, 1, {}, "[API][tmp_func_id] 9 "}, // no such machine
        {0x16, 1, {6}, "[API][tmp_func_id] 2 "}, // handled by the first machine, unknown to the last
        {0x17, 1, {}, "[model:bt_cmn_searchFuncIdTable] param err. getstate = (nil) "},
        {0x19, 1, {}, "When EVENT recieved , current_state is 65535 "}, // a machine that handles nothing
        {0xFFFF, 1, {}, "[API][START] bt_cmn_searchDispatchTable"}, // the end row is not a row
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.cid);
        BtMessage message = message_with(row.cid);
        g_actions.clear();
        g_message_seen = &message;
        const Lines lines =
            logged("CMN", [&] { EXPECT_EQ(BT_CMN_doMtxFunc(&message, kDispatch, kMachines), row.result); });
        EXPECT_EQ(g_actions, row.actions);
        EXPECT_EQ(g_message_seen, &message);
        EXPECT_THAT(lines, testing::Contains(row.line));
    }
    BtMessage message = message_with(0x10);
    EXPECT_EQ(
        logged("CMN", [&] { BT_CMN_doMtxFunc(&message, kDispatch, kMachines); }),
        (Lines{"[API][START] BT_CMN_doMtxFunc", "[API][START] bt_cmn_searchDispatchTable",
               "[API][START] bt_cmn_searchFuncIdTable", "[API][tmp_func_id] 1 ", "[API][START] bt_cmn_searchMtxTable",
               "data->msg_header.hdr.cid of RECV EVENT is 10 ", "When EVENT recieved , current_state is 1 ",
               "[API][END] bt_cmn_searchMtxTable (0)", "[API][END] bt_cmn_searchFuncIdTable (0)",
               "[API][END] bt_cmn_searchDispatchTable (0)", "[API][END] BT_CMN_doMtxFunc (0)"}));
}

TEST(EventHandling, NullArgumentsAreRefusedAtEveryLevel)
{
    BtMessage message = message_with(0x10);
    const auto refused = [](const std::string& place, const std::string& name, const std::string& text,
                            const std::string& last, const std::function<uint32_t()>& call) {
        EXPECT_EQ(logged("CMN", [&] { EXPECT_EQ(call(), 1u); }),
                  (Lines{"[API][START] " + name, "[" + place + ":" + name + "] param err. " + text, last}));
    };
    const std::string nil = "(nil)", data = pointer_text(&message), machines = pointer_text(kMachines);
    for (int which = 0; which < 3; ++which) {
        void* const a = which == 0 ? nullptr : &message;
        const BtDispatchRow* const b = which == 1 ? nullptr : kDispatch;
        const BtFunctionIdRow* const c = which == 2 ? nullptr : kMachines;
        const std::string text = "data = " + pointer_text(a) + ", dispatch_table = " + pointer_text(b) +
                                 ", func_id_table = " + pointer_text(c) + " ";
        refused("api", "BT_CMN_doMtxFunc", text, "[API][END] BT_CMN_doMtxFunc (1)",
                [=] { return BT_CMN_doMtxFunc(a, b, c); });
        refused("model", "bt_cmn_searchDispatchTable", text, "[API][MODEL] bt_cmn_searchDispatchTable ",
                [=] { return bt_cmn_searchDispatchTable(a, b, c); });
        refused("model", "bt_cmn_searchFuncIdTable", text, "[API][MODEL] bt_cmn_searchFuncIdTable ",
                [=] { return bt_cmn_searchFuncIdTable(a, b, c); });
    }
    refused("model", "bt_cmn_searchMtxTable", "data = (nil), func_id_table = " + machines + " ",
            "[API][MODEL] bt_cmn_searchMtxTable ", [] { return bt_cmn_searchMtxTable(nullptr, kMachines, 1); });
    refused("model", "bt_cmn_searchMtxTable", "data = " + data + ", func_id_table = (nil) ",
            "[API][MODEL] bt_cmn_searchMtxTable ", [&] { return bt_cmn_searchMtxTable(&message, nullptr, 1); });
    refused("model", "bt_cmn_searchMtxTable", "mtx_table = (nil) ", "[API][MODEL] bt_cmn_searchMtxTable ",
            [&] { return bt_cmn_searchMtxTable(&message, &kMachines[3], 1); });
    refused("api", "BT_CMN_nopMtxFunc", "data = (nil) ", "[API][END] BT_CMN_nopMtxFunc (1)",
            [] { return BT_CMN_nopMtxFunc(nullptr); });
    refused("api", "BT_CMN_errMtxFunc", "data = (nil) ", "[API][END] BT_CMN_errMtxFunc (1)",
            [] { return BT_CMN_errMtxFunc(nullptr); });
}

TEST(StockFunctions, DoAndLogWhatTheirNamesSay)
{
    BtMessage message = message_with(0xA0);
    const Lines lines = logged("CMN", [&] {
        EXPECT_EQ(BT_CMN_nopMtxFunc(&message), 0u);
        EXPECT_EQ(BT_CMN_errMtxFunc(&message), 1u);
        EXPECT_EQ(BT_CMN_nopGetState(), 0xFFFFu);
        BT_CMN_nopEntryExit();
    });
    EXPECT_EQ(lines, (Lines{"[API][START] BT_CMN_nopMtxFunc", "[API][END] BT_CMN_nopMtxFunc (0)",
                            "[API][START] BT_CMN_errMtxFunc", "[api:BT_CMN_errMtxFunc] event id = 00a0 ",
                            "[API][END] BT_CMN_errMtxFunc (1)", "[API][START] BT_CMN_nopGetState",
                            "[API][END] BT_CMN_nopGetState (65535)", "[API][START] BT_CMN_nopEntryExit",
                            "[API][END] BT_CMN_nopEntryExit "}));
}

} // namespace
