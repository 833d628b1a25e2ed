// Many threads at once: requests, log, trace, shared areas and their first use. Also run under the thread sanitizer.
#include "request_rows.h"

#include <bt_service/bt_service.h>
#include <gmock/gmock.h>

#include <array>
#include <atomic>
#include <map>
#include <thread>

namespace {

using fake::Bytes;

constexpr uint32_t kThreads = 8;

// Runs body(0..7), each in a thread of its own, all let go at the same moment.
template <class Body>
void on_threads(Body body)
{
    std::atomic<uint32_t> waiting{kThreads};
    std::vector<std::thread> threads;
    for (uint32_t i = 0; i < kThreads; ++i)
        threads.emplace_back([&, i] {
            --waiting;
            while (waiting != 0)
                std::this_thread::yield();
            body(i);
        });
    for (std::thread& thread : threads)
        thread.join();
}

// ---- requests

struct Sender {
    requests::Channel channel;
    requests::Row row;
};

// One request through each sender, all bytes of its payload but a length the same.
std::vector<Sender> senders(uint8_t tag)
{
    using requests::call, requests::Given;
    const std::string v = fake::to_hex({tag}).substr(0, 2) + "*";
    return {{{0x08C1, 0, 0, nullptr}, {"", 0x1105, v + "256", call(BT_SRV_sendHciCommand, Given(v + "256"))}},
            {{0x08C2, 0xFF02, 1024, nullptr},
             {"", 0xA0F3, v + "32", call(BT_SRV_CON_startServiceDiscovery_UUID, Given(v + "8"), Given(v + "24"))}},
            {{0x08C3, 0, 0, nullptr}, {"", 0x2003, v + "48", call(BT_SRV_HFP_sendATCommand, Given(v + "48"))}},
            {{0x08C4, 0, 0, nullptr},
             {"", 0x1024, "01EE " + v + "494", call(BT_SRV_AVP_STRCTL_setDeviceFileName, 494u, Given(v + "494"))}},
            {{0x08C6, 0, 0, nullptr},
             {"", 0x30A0, "EE03 " + v + "1006", call(BT_SRV_OPP_pushResponseReq, Given("EE03 " + v + "1006"))}},
            {{0x08CA, 0, 0, nullptr}, {"", 0x5009, v + "17", call(BT_SRV_MAP_getMessage, Given(v + "20"))}}};
}

TEST(ThreadsRequests, EveryMessageIsWhole)
{
    constexpr uint32_t kRounds = 50;
    fake::reset();
    std::map<std::pair<uint32_t, Bytes>, uint32_t> expected, posted;
    std::vector<std::vector<Sender>> all;
    for (uint32_t i = 0; i < kThreads; ++i) {
        all.push_back(senders(static_cast<uint8_t>(0x11 * (i + 1))));
        for (const Sender& sender : all.back())
            expected[{sender.channel.pno, requests::message_of(sender.channel, sender.row)}] = kRounds;
    }
    on_threads([&](uint32_t i) {
        for (uint32_t round = 0; round < kRounds; ++round)
            for (const Sender& sender : all[i])
                EXPECT_EQ(sender.row.call(), 0);
    });
    for (const fake::Post& post : fake::posts())
        ++posted[{post.pno, post.message}];
    EXPECT_EQ(posted.size(), expected.size());
    EXPECT_TRUE(posted == expected);
}

// ---- log and trace

using Counts = std::map<std::string, uint32_t>;

// Counts the records of a log, their times left out. A record is a line with a time and what follows up to the next.
Counts records_in(const std::string& log)
{
    Counts counts;
    std::istringstream lines(log);
    std::string record;
    for (std::string line; std::getline(lines, line);) {
        if (line.size() > 24 && line[4] == '/' && line[23] == ' ') {
            if (!record.empty()) ++counts[record];
            record = line.substr(24);
        } else {
            record += "\n" + line;
        }
    }
    if (!record.empty()) ++counts[record];
    return counts;
}

// The part of the log file written by `body`, and standard output as it left it.
std::pair<std::string, std::string> outputs_of(const std::function<void()>& body)
{
    const auto file = [] {
        std::fflush(bt_cmn_log_fpget());
        const auto content = fake::read_file("/tmp/bt_cmn.log");
        return content ? std::string(content->begin(), content->end()) : "";
    };
    const size_t before = file().size();
    testing::internal::CaptureStdout();
    body();
    std::fflush(stdout);
    return {file().substr(before), testing::internal::GetCapturedStdout()};
}

class ThreadsLog : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        fake::write_file("/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG", {});
        BT_CMN_DebugLogSelecter();
        DebugConsoleLogSts = DebugFileOutLogSts = 1;
    }
    void TearDown() override
    {
        BT_CMN_DebugLogSelecter();
        DebugSRVOutLogSts = 0;
        fake::reset();
    }
};

TEST_F(ThreadsLog, FileIsOpenedOnce)
{
    for (int round = 0; round < 20; ++round)
        EXPECT_TRUE(fake::in_child([] {
            std::array<FILE*, kThreads> streams{};
            on_threads([&](uint32_t i) { streams[i] = bt_cmn_log_fpget(); });
            EXPECT_NE(streams[0], nullptr);
            EXPECT_THAT(streams, testing::Each(streams[0]));
        }));
}

TEST_F(ThreadsLog, RecordsAreWhole)
{
    constexpr uint32_t kRounds = 200;
    const auto write = [](uint32_t i) {
        const std::string text(300, static_cast<char>('a' + i));
        _BT_CMN_logout_Console_And_File("CMN", "%s", text.c_str());
        _BT_CMN_logout_File("EDS", "%s", text.c_str());
        BT_CMN_logdump("CMN", text.c_str(), reinterpret_cast<const uint8_t*>(text.data()), 40);
    };
    const auto one_by_one = outputs_of([&] {
        for (uint32_t i = 0; i < kThreads; ++i)
            write(i);
    });
    Counts file = records_in(one_by_one.first), console = records_in(one_by_one.second);
    EXPECT_EQ(file.size(), 3 * kThreads);
    EXPECT_EQ(console.size(), 2 * kThreads);
    for (Counts* counts : {&file, &console})
        for (auto& [record, count] : *counts)
            count *= kRounds;

    bt_cmn_log_fp_reset(); // the threads find the file not open
    const auto at_once = outputs_of([&] {
        on_threads([&](uint32_t i) {
            for (uint32_t round = 0; round < kRounds; ++round)
                write(i);
        });
    });
    EXPECT_EQ(records_in(at_once.first), file);
    EXPECT_EQ(records_in(at_once.second), console);
}

TEST_F(ThreadsLog, TraceLinesAreWhole)
{
    constexpr uint32_t kRounds = 100;
    DebugSRVOutLogSts = 1;
    g_VexLogParams.enabled_zones[VEXLOG_Zone / 32] |= 1u << (VEXLOG_Zone % 32);
    const auto outputs = outputs_of([] {
        on_threads([](uint32_t i) {
            BtMessage message{};
            message.msg_header.hdr.cid = static_cast<uint16_t>(0x1001 * (i + 1));
            message.msg_header.hdr.len = 200;
            std::memset(message.payload, static_cast<int>(0x11 * (i + 1)), sizeof message.payload);
            for (uint32_t round = 0; round < kRounds; ++round)
                EXPECT_EQ(BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, &message), 0);
        });
    });
    Counts expected, file, console, logger;
    for (uint32_t i = 1; i <= kThreads; ++i) {
        const std::string digit = std::to_string(i);
        expected["BTSRV " + digit + "00" + digit + " " + std::string(256, digit[0])] = kRounds;
    }
    const auto count = [](const std::string& text, Counts& counts) {
        std::istringstream lines(text);
        for (std::string line; std::getline(lines, line);)
            ++counts[line];
    };
    count(outputs.first, file);
    count(outputs.second, console);
    for (const fake::LogRecord& record : fake::logs())
        if (record.channel == "QvLog") count(record.text, logger);
    EXPECT_EQ(file, expected);
    EXPECT_EQ(console, expected);
    EXPECT_EQ(logger, expected);
    g_VexLogParams.enabled_zones[VEXLOG_Zone / 32] &= ~(1u << (VEXLOG_Zone % 32));
}

// ---- shared areas

// Processes that have attached nothing yet.
void in_fresh_process(const std::function<void()>& body)
{
    EXPECT_TRUE(fake::in_child([&] {
        g_bt_con_share = {};
        g_bt_hfp_share = {};
        body();
        EXPECT_EQ(fake::held_locks(), 0u);
        EXPECT_LE(fake::deepest_lock(), 1u);
        EXPECT_EQ(fake::stray_unlocks(), 0u);
    }));
}

TEST(ThreadsAttach, ConnectionAreaIsReadyForWhoeverComesFirst)
{
    fake::reset();
    uint8_t* const area = fake::area("BT_CON_SHARE_DATA_NAME", 27796, 0x5A);
    std::memset(area, 0, 19148);
    for (const uint32_t mode : {0u, 1u}) {
        fake::remove_file("/fs/tmpfs/btdevicelist.txt"); // what the other mode left behind
        in_fresh_process([&] {
            on_threads([&](uint32_t i) {
                EXPECT_EQ(bt_con_ApiInit(mode), 0);
                EXPECT_NE(g_bt_con_share.semaphore, 0u);
                EXPECT_EQ(static_cast<void*>(g_bt_con_share.area), area);
                const BtDevAddress address = {{static_cast<uint8_t>(i), 2, 3, 4, 5, 6}, {0, 0}};
                EXPECT_EQ(bt_con_addOrderList(&address), 0);
                uint32_t scan_mode = 0;
                EXPECT_EQ(BT_SRV_CON_getScanMode(&scan_mode), 0);
                EXPECT_EQ(scan_mode, 0x5A5A5A5Au);
                int32_t position = -1, count = -1;
                EXPECT_EQ(bt_con_SearshOrderListAddr(&address, &position), 0);
                EXPECT_EQ(bt_con_getRegisterDeviceNum(&count), 0);
                EXPECT_EQ(count, 0);
            });
            BtConOrderList list;
            EXPECT_EQ(bt_con_getallOrderList(&list), 0);
            EXPECT_EQ(list.num, static_cast<int32_t>(kThreads)) << "nobody's device was lost";
        });
    }
}

TEST(ThreadsAttach, HandsFreeAreaIsReadyForWhoeverComesFirst)
{
    fake::reset();
    fake::area("BT_HFP_SHARE_DATA_NAME", 1084, 0x5A);
    in_fresh_process([] {
        on_threads([](uint32_t i) {
            uint32_t level = 0;
            BtHfpCallList calls{};
            EXPECT_EQ(BT_SRV_HFP_getSignalLevel(&level), 0);
            EXPECT_TRUE(level == 0x5A5A5A5A || level == 6) << level;
            EXPECT_EQ(i == 0 ? bt_hfp_InitShareMemData() : 0, 0);
            EXPECT_EQ(BT_SRV_HFP_getCallList(&calls), 0);
            const auto* const bytes = reinterpret_cast<const uint8_t*>(&calls);
            EXPECT_EQ(Bytes(bytes, bytes + sizeof calls), Bytes(sizeof calls, bytes[0])) << "all old or all new";
        });
    });
}

TEST(ThreadsAttach, ListenersGetHandlesOfTheirOwn)
{
    fake::reset();
    fake::area("/tmp/shm_eds_regist_table", 8004);
    in_fresh_process([] {
        BT_EDS_initialize(); // as the distributor does before any listener registers
        std::array<std::array<uint32_t, 6>, kThreads> handles{};
        on_threads([&](uint32_t i) {
            const uint32_t id = 0xA881 + i;
            for (uint32_t& handle : handles[i])
                handle = BT_SRV_EvtSrv_regist(0x4000 + i, i, 1, &id);
            BT_SRV_EvtSrv_suspend(handles[i][0]);
            BT_SRV_EvtSrv_resume(handles[i][0]);
            BtMessage event{};
            BT_EDS_dispatch(0, &event);
        });
        std::set<uint32_t> distinct;
        for (uint32_t i = 0; i < kThreads; ++i)
            for (const uint32_t handle : handles[i]) {
                distinct.insert(handle);
                const BtEvtListener* const listener = find_HdlList(handle);
                ASSERT_NE(listener, nullptr) << handle;
                EXPECT_EQ(listener->pno, 0x4000 + i);
                EXPECT_EQ(listener->event_ids[0], 0xA881 + i);
            }
        EXPECT_EQ(distinct.size(), 6 * kThreads);
        EXPECT_EQ(*distinct.rbegin(), 6 * kThreads);
    });
}

TEST(ThreadsAreas, WrittenAreasHoldTheDataOfOneThread)
{
    fake::reset();
    const uint8_t* const block = fake::area("/tmp/shm_map_serviceapi", 900);
    const uint8_t* const push = fake::area("/tmp/shm_map_pushmsg", 9652);
    on_threads([](uint32_t i) {
        const Bytes body(1500, static_cast<uint8_t>(i));
        push_record record;
        std::memset(&record, static_cast<int>(i), sizeof record);
        record.body = body.data();
        record.body_length = 1500;
        message_filter filter;
        std::memset(&filter, static_cast<int>(i), sizeof filter);
        filter.folder_length = 256;
        for (int round = 0; round < 20; ++round) {
            EXPECT_EQ(BT_SRV_MAP_getMessageNum(i, filter), 0);
            EXPECT_EQ(BT_SRV_MAP_setPushMessageData(record), 0);
        }
    });
    const uint8_t writer = block[4], pusher = push[0];
    EXPECT_EQ(Bytes(block + 9, block + 266), Bytes(257, writer));
    EXPECT_EQ(block[0] + 256u * block[1], 43u + 256 + 2 * writer);
    EXPECT_EQ(Bytes(push, push + 2628), Bytes(2628, pusher));
    EXPECT_EQ(Bytes(push + 8152, push + 9652), Bytes(1500, pusher));
}

} // namespace
