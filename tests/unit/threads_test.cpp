// Many threads at once: requests, log, trace, shared areas and their first use. Also run under the thread sanitizer.
#include "log_capture.h"
#include "store_support.h"

#include <bt_service/bt_service.h>
#include <gmock/gmock.h>

#include <array>
#include <atomic>
#include <cstring>
#include <map>
#include <sstream>
#include <thread>

using namespace store;

namespace {

constexpr uint32_t kThreads = 8;
constexpr uint32_t kRounds = 100;

using Body = std::function<void(uint32_t)>;

// Runs body(0..7), each in a thread of its own, all let go at the same moment.
void at_once(const Body& body)
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

// ---- what many threads write at once is whole: the same as when they write one after the other

using Counts = std::map<std::string, uint32_t>;

// A record begins with a time, which is left out, or is a line of the trace; the lines of a dump belong to theirs.
void count_records(const std::string& output, const std::string& text, Counts& counts)
{
    std::istringstream lines(text);
    std::string record;
    for (std::string line; std::getline(lines, line);) {
        const bool timed = line.size() > 24 && line[4] == '/' && line[23] == ' ';
        if (!record.empty() && (timed || line[0] == 'B')) {
            ++counts[output + record];
            record.clear();
        }
        record += timed ? line.substr(24) : line;
    }
    if (!record.empty()) ++counts[output + record];
}

Counts left_by(uint32_t rounds, const std::function<void(const Body&)>& run, const Body& body)
{
    fake::reset();
    bt_cmn_log_fp_reset(); // the threads find the file not open
    const Body rounds_of = [&](uint32_t i) {
        for (uint32_t round = 0; round < rounds; ++round)
            body(i);
    };
    const Outputs outputs = outputs_of([&] { run(rounds_of); });
    Counts counts;
    count_records("console ", outputs.console, counts);
    count_records("file ", outputs.file, counts);
    for (const fake::LogRecord& record : fake::logs())
        ++counts[record.channel + record.text];
    for (const fake::Post& post : fake::posts())
        ++counts[std::to_string(post.pno) + " " + fake::to_hex(post.message)];
    return counts;
}

void expect_whole(size_t distinct, const Body& body)
{
    const auto one_by_one = [](const Body& all) {
        for (uint32_t i = 0; i < kThreads; ++i)
            all(i);
    };
    Counts expected = left_by(1, one_by_one, body);
    EXPECT_EQ(expected.size(), kThreads * distinct);
    for (auto& [record, count] : expected)
        count *= kRounds;
    EXPECT_TRUE(left_by(kRounds, at_once, body) == expected);
}

TEST(ThreadsOutput, EveryMessageIsWhole)
{
    expect_whole(6, [](uint32_t i) {
        const auto digit = static_cast<uint8_t>(0x11 * (i + 1));
        Bytes bytes(1008, digit), sized(1008, digit);
        put(sized, 0, {0xEE, 0x03});
        const At at(bytes.data());
        EXPECT_EQ(BT_SRV_sendHciCommand(at), 0);
        EXPECT_EQ(BT_SRV_CON_startServiceDiscovery_UUID(at, at + 8), 0);
        EXPECT_EQ(BT_SRV_HFP_sendATCommand(at), 0);
        EXPECT_EQ(BT_SRV_AVP_STRCTL_setDeviceFileName(494, at), 0);
        EXPECT_EQ(BT_SRV_OPP_pushResponseReq(sized.data()), 0);
        EXPECT_EQ(BT_SRV_MAP_getMessage(at), 0);
    });
}

TEST(ThreadsOutput, EveryLogRecordIsWhole)
{
    DebugConsoleLogSts = DebugFileOutLogSts = DebugSRVOutLogSts = 1;
    const BtLogParameters before = g_VexLogParams;
    g_VexLogParams.enabled_zones[VEXLOG_Zone / 32] |= 1u << (VEXLOG_Zone % 32);
    expect_whole(11, [](uint32_t i) {
        const std::string text(300, static_cast<char>('a' + i));
        _BT_CMN_logout_Console_And_File("CMN", "%s", text.c_str());
        _BT_CMN_logout_File("EDS", "%s", text.c_str());
        BT_CMN_logdump("CMN", text.c_str(), reinterpret_cast<const uint8_t*>(text.data()), 40);
        BtMessage message{};
        message.msg_header.hdr.cid = static_cast<uint16_t>(0x1001 * (i + 1));
        message.msg_header.hdr.len = 200;
        std::memset(message.payload, static_cast<int>(0x11 * (i + 1)), sizeof message.payload);
        EXPECT_EQ(BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, &message), 0);
    });
    g_VexLogParams = before;
    DebugConsoleLogSts = DebugFileOutLogSts = DebugSRVOutLogSts = 0;
}

TEST(ThreadsOutput, LogFileIsOpenedOnce)
{
    for (int round = 0; round < 20; ++round) {
        bt_cmn_log_fp_reset();
        std::array<FILE*, kThreads> streams{};
        at_once([&](uint32_t i) { streams[i] = bt_cmn_log_fpget(); });
        EXPECT_NE(streams[0], nullptr);
        EXPECT_THAT(streams, testing::Each(streams[0]));
    }
}

// ---- shared areas

struct Area {
    const char* name;
    uint32_t size;
    uint8_t fill;
};

// Runs `body` at once in a process that has attached nothing, where the area is as given; `check` looks at it then.
void on_fresh_area(
    const Area& area, const Body& body, const std::function<void(const uint8_t*)>& check, void (*prepare)() = [] {})
{
    EXPECT_TRUE(fake::in_child([&] {
        fake::reset();
        g_bt_con_share = {};
        g_bt_hfp_share = {};
        const uint8_t* const at = fake::area(area.name, area.size, area.fill);
        prepare();
        at_once(body);
        check(at);
        EXPECT_EQ(fake::held_locks(), 0u);
        EXPECT_LE(fake::deepest_lock(), 1u);
        EXPECT_EQ(fake::stray_unlocks(), 0u);
    })) << area.name;
}

TEST(ThreadsAreas, ConnectionAreaIsReadyForWhoeverComesFirst)
{
    for (const uint32_t mode : {0u, 1u}) {
        fake::write_file(kImagePath, image_of(default_data()));
        const auto body = [mode, none = At(nullptr)](uint32_t i) {
            const Given device(dev(std::string(1, static_cast<char>('A' + i)))),
                name(Bytes(256, static_cast<uint8_t>(i)));
            Bytes record(1008);
            EXPECT_EQ(bt_con_ApiInit(mode), 0);
            EXPECT_NE(g_bt_con_share.semaphore, 0u);
            EXPECT_EQ(BT_SRV_CON_getRemoteDeviceInfo(device, At(record.data())), -1);
            EXPECT_EQ(bt_con_addRegDev(device, name, none, none, none, none, none, none, 1, 2, none, 3), 0);
            EXPECT_EQ(bt_con_addOrderList(device), 0);
            EXPECT_EQ(bt_con_addConnectOrder(device, 0), 0);
            for (uint8_t round = 1; round < 20; ++round) // stored under the lock, mirrored behind it
                EXPECT_EQ(bt_con_setRegisteredDeviceDIDInfoList(Given(id_list(id_entry('A', i + 1, round))), 1), 0);
            EXPECT_EQ(BT_SRV_CON_getRemoteDeviceInfo(device, At(record.data())), 0);
            EXPECT_EQ(Bytes(record.begin(), record.begin() + 256), name.bytes());
        };
        const auto check = [](const uint8_t* area) {
            for (const size_t count : {size_t{kDevices}, size_t{kOrder}, size_t{kProfileOrders}})
                EXPECT_EQ(area[count], kThreads) << "nobody's device was lost";
            EXPECT_EQ(difference(*fake::read_file(kImagePath), image_of(area_bytes())), "");
        };
        on_fresh_area({kAreaName, kAreaSize, 0}, body, check);
    }
}

TEST(ThreadsAreas, HandsFreeAreaIsReadyForWhoeverComesFirst)
{
    const auto body = [](uint32_t i) {
        uint32_t level = 0;
        BtHfpCallList calls{};
        EXPECT_EQ(BT_SRV_HFP_getSignalLevel(&level), 0);
        EXPECT_TRUE(level == 0x5A5A5A5A || level == 6) << level;
        EXPECT_EQ(i == 0 ? bt_hfp_InitShareMemData() : 0, 0);
        EXPECT_EQ(BT_SRV_HFP_getCallList(&calls), 0);
        const auto* const bytes = reinterpret_cast<const uint8_t*>(&calls);
        EXPECT_EQ(Bytes(bytes, bytes + sizeof calls), Bytes(sizeof calls, bytes[0])) << "all old or all new";
    };
    on_fresh_area({"BT_HFP_SHARE_DATA_NAME", 1084, 0x5A}, body, [](const uint8_t*) {});
}

TEST(ThreadsAreas, ListenersGetHandlesOfTheirOwn)
{
    const auto body = [](uint32_t i) {
        const uint32_t id = 0xA881 + i;
        uint32_t handle = 0;
        for (int listener = 0; listener < 6; ++listener)
            handle = BT_SRV_EvtSrv_regist(0x4000 + i, i, 1, &id);
        BT_SRV_EvtSrv_suspend(handle);
        BT_SRV_EvtSrv_resume(handle);
        const BtMessage event{};
        BT_EDS_dispatch(0, &event);
    };
    const auto check = [](const uint8_t*) {
        std::map<uint32_t, int> listeners;
        for (uint32_t handle = 1; handle <= 6 * kThreads; ++handle) {
            const BtEvtListener* const listener = find_HdlList(handle);
            ASSERT_NE(listener, nullptr) << handle;
            EXPECT_EQ(listener->event_ids[0], 0xA881 + listener->tag);
            ++listeners[listener->tag];
        }
        for (uint32_t i = 0; i < kThreads; ++i)
            EXPECT_EQ(listeners[i], 6);
    };
    on_fresh_area({"/tmp/shm_eds_regist_table", 8004, 0}, body, check, BT_EDS_initialize); // as the distributor does
}

TEST(ThreadsAreas, WrittenAreasHoldTheDataOfOneThread)
{
    on_fresh_area(
        {"/tmp/shm_map_serviceapi", 900, 0},
        [](uint32_t i) {
            message_filter filter;
            std::memset(&filter, static_cast<int>(i), sizeof filter);
            filter.folder_length = 256;
            for (int round = 0; round < 20; ++round)
                EXPECT_EQ(BT_SRV_MAP_getMessageNum(i, filter), 0);
        },
        [](const uint8_t* block) {
            EXPECT_EQ(Bytes(block + 9, block + 266), Bytes(257, block[4]));
            EXPECT_EQ(block[0] + 256u * block[1], 43u + 256 + 2 * block[4]);
        });
    on_fresh_area(
        {"/tmp/shm_map_pushmsg", 9652, 0},
        [](uint32_t i) {
            const Bytes body(1500, static_cast<uint8_t>(i));
            push_record record;
            std::memset(&record, static_cast<int>(i), sizeof record);
            record.body = body.data();
            record.body_length = 1500;
            for (int round = 0; round < 20; ++round)
                EXPECT_EQ(BT_SRV_MAP_setPushMessageData(record), 0);
        },
        [](const uint8_t* push) {
            EXPECT_EQ(Bytes(push, push + 2628), Bytes(2628, push[0]));
            EXPECT_EQ(Bytes(push + 8152, push + 9652), Bytes(1500, push[0]));
        });
}

} // namespace
