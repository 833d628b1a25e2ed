// The state machine engine: order of exit and entry functions, the searches, and every line they log.
#include "log_capture.h"

#include <bt_service/bt_message.h>
#include <bt_service/bt_state_machine.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;

std::vector<std::string> g_run;
uint32_t g_current;
std::vector<uint32_t> g_state_seen;

template <char Name>
void enter()
{
    g_run.push_back(std::string("+") + Name);
    g_state_seen.push_back(g_current);
}
template <char Name>
void leave()
{
    g_run.push_back(std::string("-") + Name);
    g_state_seen.push_back(g_current);
}

// R holds P and Q; A, B are in P; C is in Q; S and T stand alone.
enum : uint32_t { kA = 1, kB, kC, kP, kQ, kR, kS, kT, kUnknown = 0x99 };
const BtStateRow kTop[] = {{kR, enter<'R'>, leave<'R'>, nullptr},
                           {kP, enter<'P'>, leave<'P'>, &kTop[0]},
                           {kQ, enter<'Q'>, leave<'Q'>, &kTop[0]}};
const BtStateRow kStates[] = {{kA, enter<'A'>, leave<'A'>, &kTop[1]}, {kB, enter<'B'>, leave<'B'>, &kTop[1]},
                              {kC, enter<'C'>, leave<'C'>, &kTop[2]}, {kP, enter<'P'>, leave<'P'>, &kTop[0]},
                              {kS, enter<'S'>, leave<'S'>, nullptr},  {kT, enter<'T'>, leave<'T'>, nullptr},
                              {0xFFFF, nullptr, nullptr, nullptr}};

TEST(StateChange, RunsExitsUpwardsThenEntriesDownwards)
{
    struct Row {
        uint32_t from, to;
        int32_t result;
        std::vector<std::string> run;
        uint32_t after;
    };
    const Row rows[] = {
        {kS, kT, 0, {"-S", "+T"}, kT},
        {kA, kB, 0, {"-A", "+B"}, kB},
        {kA, kC, 0, {"-A", "-P", "-R", "+R", "+Q", "+C"}, kC},
        {kA, kP, 0, {"-A", "-P", "-R", "+R", "+P"}, kP},
        {kP, kA, 0, {"-P", "-R", "+R", "+P", "+A"}, kA},
        {kS, kC, 0, {"-S", "+R", "+Q", "+C"}, kC},
        {kC, kS, 0, {"-C", "-Q", "-R", "+S"}, kS},
        {kA, kA, 1, {}, kA},
        {kUnknown, kA, 1, {}, kUnknown},
        {kS, kUnknown, 1, {"-S"}, kS}, // no row, so no parent: the same as S has
        {kA, kUnknown, 1, {"-A", "-P", "-R"}, kA},
        {kUnknown, kUnknown, 1, {}, kUnknown},
    };
    for (const Row& row : rows) {
        g_run.clear();
        g_state_seen.clear();
        g_current = row.from;
        EXPECT_EQ(BT_CMN_changeStatus(&g_current, row.to, kStates), row.result) << row.from << "->" << row.to;
        EXPECT_THAT(g_run, ElementsAreArray(row.run)) << row.from << "->" << row.to;
        EXPECT_EQ(g_current, row.after);
        EXPECT_THAT(g_state_seen, testing::Each(row.from)) << "the old state stands while they run";
    }
}

TEST(StateChange, DuplicateRowsAllRunAndTheLastParentCounts)
{
    const BtStateRow rows[] = {{kA, enter<'1'>, leave<'1'>, &kTop[1]},
                               {kA, enter<'2'>, leave<'2'>, nullptr},
                               {kB, enter<'3'>, leave<'3'>, &kTop[1]},
                               {kB, enter<'4'>, leave<'4'>, nullptr},
                               {0xFFFF, nullptr, nullptr, nullptr}};
    g_run.clear();
    g_current = kA;
    EXPECT_EQ(BT_CMN_changeStatus(&g_current, kB, rows), 0);
    EXPECT_THAT(g_run, ElementsAre("-1", "-2", "+3", "+4"));
}

TEST(StateChange, LogsEachStep)
{
    LogCapture log;
    const std::string start = "CMN|[API][START] BT_CMN_changeStatus";
    g_current = kA;
    BT_CMN_changeStatus(nullptr, kB, kStates);
    BT_CMN_changeStatus(&g_current, kB, nullptr);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start,
                            "CMN|[api:BT_CMN_changeStatus] param err. current_state = (nil), state_table = " +
                                pointer_text(kStates),
                            "CMN|[API][END] BT_CMN_changeStatus (1)", start,
                            "CMN|[api:BT_CMN_changeStatus] param err. current_state = " + pointer_text(&g_current) +
                                ", state_table = (nil)",
                            "CMN|[API][END] BT_CMN_changeStatus (1)"));
    BT_CMN_changeStatus(&g_current, kA, kStates);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start,
                            "CMN|[api:BT_CMN_changeStatus] param err. current_state = 0x0001, next_state = 0x0001",
                            "CMN|[API][END] BT_CMN_changeStatus (1)"));
    BT_CMN_changeStatus(&g_current, kB, &kStates[6]);
    g_current = kUnknown;
    BT_CMN_changeStatus(&g_current, kB, kStates);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start,
                            "CMN|[api:BT_CMN_changeStatus] param err. current_state = 0x0001, tmp_state = 0xffff",
                            "CMN|[api:BT_CMN_changeStatus] ret = 1", start,
                            "CMN|[api:BT_CMN_changeStatus] param err. current_state = 0x0099, tmp_state = 0xffff",
                            "CMN|[api:BT_CMN_changeStatus] ret = 1"));
    g_current = kS;
    BT_CMN_changeStatus(&g_current, kP, kStates);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start, "CMN|[API][MODEL] bt_cmn_changeStatusExit",
                            "CMN|[model:bt_cmn_changeStatusExit] done state( 0007 ) exit func. ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusExit ", "CMN|[API][MODEL] bt_cmn_changeStatusEntry",
                            "CMN|[model:bt_cmn_changeStatusEntry] state( 0004 ) has parent state. ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusEntry",
                            "CMN|[model:bt_cmn_changeStatusEntry] done state( 0006 ) entry func. ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusEntry ",
                            "CMN|[model:bt_cmn_changeStatusEntry] done state( 0004 ) entry func. ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusEntry ", "CMN|[API][END] BT_CMN_changeStatus (0)"));
}

TEST(StateChange, ChainsRefuseNullRows)
{
    LogCapture log;
    bt_cmn_changeStatusExit(nullptr);
    bt_cmn_changeStatusEntry(nullptr);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][MODEL] bt_cmn_changeStatusExit",
                            "CMN|[model:bt_cmn_changeStatusExit] param err. state_table = (nil) ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusExit ", "CMN|[API][MODEL] bt_cmn_changeStatusEntry",
                            "CMN|[model:bt_cmn_changeStatusEntry] param err. state_table = (nil) ",
                            "CMN|[API][MODEL] bt_cmn_changeStatusEntry "));
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
uint32_t state_one()
{
    return 1;
}
uint32_t state_two()
{
    return 2;
}

const BtMatrixRow kFirstMatrix[] = {
    {1, 0x10, action<1, 0>}, {1, 0x10, action<2, 5>}, // never reached: the first row counts
    {1, 0x11, action<3, 7>}, {1, 0x12, nullptr},      {1, 0x13, BT_CMN_errMtxFunc},
    {2, 0x14, action<4, 0>}, {0xFFFF, 0, nullptr}};
const BtMatrixRow kSecondMatrix[] = {{2, 0x11, action<5, 9>}, {2, 0x16, action<6, 0>}, {0xFFFF, 0, nullptr}};
const BtFunctionIdRow kMachines[] = {
    {1, state_one, kFirstMatrix}, {2, state_two, kSecondMatrix},         {3, nullptr, kFirstMatrix},
    {4, state_one, nullptr},      {5, BT_CMN_nopGetState, kFirstMatrix}, {0xFFFF, nullptr, nullptr}};
const BtDispatchRow kDispatch[] = {{0x10, 1}, {0x11, 1}, {0x11, 2}, {0x12, 1}, {0x13, 1}, {0x14, 1},  {0x15, 9},
                                   {0x16, 2}, {0x16, 1}, {0x17, 3}, {0x18, 4}, {0x19, 5}, {0xFFFF, 0}};

BtMessage message_with(uint16_t cid)
{
    BtMessage message{};
    message.msg_header.hdr.cid = cid;
    return message;
}

TEST(EventHandling, FindsTheActionOfEveryMachineThatWantsTheEvent)
{
    struct Row {
        uint16_t cid;
        uint32_t result;
        std::vector<int> actions;
    };
    const Row rows[] = {
        {0x10, 0, {1}},  {0x11, 9, {3, 5}}, // two machines, in table order; the second one's result
        {0x12, 1, {}}, // no function in the row
        {0x13, 1, {}}, // not accepted in this state
        {0x14, 1, {}}, // another state's row
        {0x15, 1, {}}, // no such machine
        {0x16, 1, {6}}, // handled by the first machine, unknown to the last
        {0x17, 1, {}}, // no getstate
        {0x18, 1, {}}, // no matrix
        {0x19, 1, {}}, // a machine that handles nothing
        {0x20, 1, {}}, // nobody wants it
        {0xFFFF, 1, {}}, // the end row is not a row
    };
    for (const Row& row : rows) {
        BtMessage message = message_with(row.cid);
        g_actions.clear();
        EXPECT_EQ(BT_CMN_doMtxFunc(&message, kDispatch, kMachines), row.result) << row.cid;
        EXPECT_THAT(g_actions, ElementsAreArray(row.actions)) << row.cid;
        if (!row.actions.empty()) {
            EXPECT_EQ(g_message_seen, &message);
        }
    }
}

TEST(EventHandling, LogsTheWholeSearch)
{
    LogCapture log;
    BtMessage message = message_with(0x10);
    BT_CMN_doMtxFunc(&message, kDispatch, kMachines);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_doMtxFunc", "CMN|[API][START] bt_cmn_searchDispatchTable",
                            "CMN|[API][START] bt_cmn_searchFuncIdTable", "CMN|[API][tmp_func_id] 1 ",
                            "CMN|[API][START] bt_cmn_searchMtxTable",
                            "CMN|data->msg_header.hdr.cid of RECV EVENT is 10 ",
                            "CMN|When EVENT recieved , current_state is 1 ", "CMN|[API][END] bt_cmn_searchMtxTable (0)",
                            "CMN|[API][END] bt_cmn_searchFuncIdTable (0)",
                            "CMN|[API][END] bt_cmn_searchDispatchTable (0)", "CMN|[API][END] BT_CMN_doMtxFunc (0)"));

    const struct {
        uint16_t cid;
        std::string line;
    } errors[] = {{0x12, "CMN|[model:bt_cmn_searchMtxTable] param err. func = (nil) "},
                  {0x17, "CMN|[model:bt_cmn_searchFuncIdTable] param err. getstate = (nil) "},
                  {0x18, "CMN|[model:bt_cmn_searchMtxTable] param err. mtx_table = (nil) "},
                  {0x13, "CMN|[api:BT_CMN_errMtxFunc] event id = 0013 "}};
    for (const auto& error : errors) {
        message = message_with(error.cid);
        BT_CMN_doMtxFunc(&message, kDispatch, kMachines);
        EXPECT_THAT(LogCapture::texts(), testing::Contains(error.line));
    }
}

TEST(EventHandling, NullArgumentsAreRefusedAtEveryLevel)
{
    LogCapture log;
    BtMessage message = message_with(0x10);
    const std::string data = pointer_text(&message), dispatch = pointer_text(kDispatch),
                      machines = pointer_text(kMachines);
    struct Row {
        std::function<uint32_t()> call;
        std::vector<std::string> lines;
    };
    const auto refused = [](const std::string& place, const std::string& text, const std::string& last) {
        const std::string name = place.substr(place.find(':') + 1);
        return std::vector<std::string>{"CMN|[API][START] " + name, "CMN|[" + place + "] param err. " + text,
                                        "CMN|" + last};
    };
    const std::string api = "api:BT_CMN_doMtxFunc", api_end = "[API][END] BT_CMN_doMtxFunc (1)";
    const std::string first = "model:bt_cmn_searchDispatchTable",
                      first_end = "[API][MODEL] bt_cmn_searchDispatchTable ";
    const std::string second = "model:bt_cmn_searchFuncIdTable", second_end = "[API][MODEL] bt_cmn_searchFuncIdTable ";
    const std::string third = "model:bt_cmn_searchMtxTable", third_end = "[API][MODEL] bt_cmn_searchMtxTable ";
    const auto three = [](const std::string& a, const std::string& b, const std::string& c) {
        return "data = " + a + ", dispatch_table = " + b + ", func_id_table = " + c + " ";
    };
    const std::string nil = "(nil)";
    const Row rows[] = {{[&] { return BT_CMN_doMtxFunc(nullptr, kDispatch, kMachines); },
                         refused(api, three(nil, dispatch, machines), api_end)},
                        {[&] { return BT_CMN_doMtxFunc(&message, nullptr, kMachines); },
                         refused(api, three(data, nil, machines), api_end)},
                        {[&] { return BT_CMN_doMtxFunc(&message, kDispatch, nullptr); },
                         refused(api, three(data, dispatch, nil), api_end)},
                        {[&] { return bt_cmn_searchDispatchTable(nullptr, kDispatch, kMachines); },
                         refused(first, three(nil, dispatch, machines), first_end)},
                        {[&] { return bt_cmn_searchDispatchTable(&message, nullptr, kMachines); },
                         refused(first, three(data, nil, machines), first_end)},
                        {[&] { return bt_cmn_searchDispatchTable(&message, kDispatch, nullptr); },
                         refused(first, three(data, dispatch, nil), first_end)},
                        {[&] { return bt_cmn_searchFuncIdTable(nullptr, kDispatch, kMachines); },
                         refused(second, three(nil, dispatch, machines), second_end)},
                        {[&] { return bt_cmn_searchFuncIdTable(&message, nullptr, kMachines); },
                         refused(second, three(data, nil, machines), second_end)},
                        {[&] { return bt_cmn_searchFuncIdTable(&message, kDispatch, nullptr); },
                         refused(second, three(data, dispatch, nil), second_end)},
                        {[&] { return bt_cmn_searchMtxTable(nullptr, kMachines, 1); },
                         refused(third, "data = (nil), func_id_table = " + machines + " ", third_end)},
                        {[&] { return bt_cmn_searchMtxTable(&message, nullptr, 1); },
                         refused(third, "data = " + data + ", func_id_table = (nil) ", third_end)},
                        {[&] { return BT_CMN_nopMtxFunc(nullptr); },
                         refused("api:BT_CMN_nopMtxFunc", "data = (nil) ", "[API][END] BT_CMN_nopMtxFunc (1)")},
                        {[&] { return BT_CMN_errMtxFunc(nullptr); },
                         refused("api:BT_CMN_errMtxFunc", "data = (nil) ", "[API][END] BT_CMN_errMtxFunc (1)")}};
    for (const Row& row : rows) {
        EXPECT_EQ(row.call(), 1u);
        EXPECT_THAT(LogCapture::texts(), ElementsAreArray(row.lines));
    }
}

TEST(StockFunctions, DoAndLogWhatTheirNamesSay)
{
    LogCapture log;
    BtMessage message = message_with(0xA0);
    EXPECT_EQ(BT_CMN_nopMtxFunc(&message), 0u);
    EXPECT_EQ(BT_CMN_errMtxFunc(&message), 1u);
    EXPECT_EQ(BT_CMN_nopGetState(), 0xFFFFu);
    BT_CMN_nopEntryExit();
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_nopMtxFunc", "CMN|[API][END] BT_CMN_nopMtxFunc (0)",
                            "CMN|[API][START] BT_CMN_errMtxFunc", "CMN|[api:BT_CMN_errMtxFunc] event id = 00a0 ",
                            "CMN|[API][END] BT_CMN_errMtxFunc (1)", "CMN|[API][START] BT_CMN_nopGetState",
                            "CMN|[API][END] BT_CMN_nopGetState (65535)", "CMN|[API][START] BT_CMN_nopEntryExit",
                            "CMN|[API][END] BT_CMN_nopEntryExit "));
}

} // namespace
