// Event queue, timers, shared memory objects and byte order.
#include "fake_platform.h"
#include "log_capture.h"

#include <bt_service/bt_byte_order.h>
#include <bt_service/bt_event_queue.h>
#include <bt_service/bt_message.h>
#include <bt_service/bt_shared_memory.h>
#include <bt_service/bt_timer.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <functional>

namespace {

using testing::ElementsAre;

// ---- event queue

struct Node {
    BtMessage slot;
    Node* link;
};
static_assert(sizeof(Node) == sizeof(BtQueueNode));

BtMessage event(uint8_t number)
{
    BtMessage message{};
    message.msg_header.hdr.cid = number;
    std::memset(message.payload, number, sizeof message.payload);
    return message;
}

class EventQueue : public testing::Test {
protected:
    EventQueue() { head_.link = &head_; }
    BtQueueNode* head() { return reinterpret_cast<BtQueueNode*>(&head_); }
    uint32_t add(uint8_t number)
    {
        const BtMessage message = event(number);
        return BT_CMN_enqueueMsg(&message, head());
    }
    // The number of the event taken, -1 when there was none.
    int take()
    {
        BtMessage buffer;
        std::memset(&buffer, 0xEE, sizeof buffer);
        if (BT_CMN_queueMsg(&buffer, head()) == 0) {
            EXPECT_EQ(buffer.payload[5], 0xEE) << "an empty queue leaves the buffer alone";
            return -1;
        }
        const BtMessage expected = event(static_cast<uint8_t>(buffer.msg_header.hdr.cid));
        EXPECT_EQ(std::memcmp(&buffer, &expected, sizeof buffer), 0);
        return buffer.msg_header.hdr.cid;
    }
    Node head_{};
};

TEST_F(EventQueue, FirstInFirstOut)
{
    EXPECT_EQ(take(), -1);
    for (int round = 0; round < 3; ++round) {
        for (uint8_t i = 1; i <= 5; ++i)
            EXPECT_EQ(add(i), 0u);
        EXPECT_EQ(take(), 1);
        EXPECT_EQ(take(), 2);
        EXPECT_EQ(add(6), 0u);
        for (int i = 3; i <= 6; ++i)
            EXPECT_EQ(take(), i);
        EXPECT_EQ(take(), -1);
        EXPECT_EQ(head_.link, &head_);
        const BtMessage zero{};
        EXPECT_EQ(std::memcmp(&head_.slot, &zero, sizeof zero), 0) << "the head's slot is cleared";
    }
    head_.link = nullptr; // one event, in the head
    head_.slot = event(9);
    EXPECT_EQ(take(), 9);
    EXPECT_EQ(take(), -1);
}

TEST_F(EventQueue, LinesCountTheEvents)
{
    LogCapture log;
    const std::string start = "CMN|[API][START] BT_CMN_enqueueMsg", end = "CMN|[API][END] BT_CMN_enqueueMsg (0)";
    for (uint8_t i = 1; i <= 3; ++i)
        add(i);
    const std::string place = "CMN|[api:BT_CMN_enqueueMsg] enqueued into the ";
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start, place + "top. ( event cnt = 1 ) ", end, start, place + "bottom. ( event cnt = 2 ) ",
                            end, start, place + "bottom. ( event cnt = 3 ) ", end));
    for (int i = 0; i < 4; ++i)
        take();
    const std::string began = "CMN|[API][START] BT_CMN_queueMsg", taken = "CMN|[API][END] BT_CMN_queueMsg (1)";
    const std::string top = "CMN|[api:BT_CMN_queueMsg] dequeued the top event. ( event cnt = ";
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(began, top + "2 ) ", taken, began, top + "1 ) ", taken, began, top + "0 ) ", taken, began,
                            "CMN|[API][BT_CMN_queueMsg] dequeued is empty. ( event cnt = 0 ) ",
                            "CMN|[API][END] BT_CMN_queueMsg (0)"));

    BtMessage message{};
    const std::string at = pointer_text(&message), queue = pointer_text(&head_);
    EXPECT_EQ(BT_CMN_enqueueMsg(nullptr, head()), 1u);
    EXPECT_EQ(BT_CMN_enqueueMsg(&message, nullptr), 1u);
    EXPECT_EQ(BT_CMN_queueMsg(nullptr, head()), 1u);
    EXPECT_EQ(BT_CMN_queueMsg(&message, nullptr), 1u);
    const std::string put_end = "CMN|[API][END] BT_CMN_enqueueMsg (1)";
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre(start, "CMN|[api:BT_CMN_enqueueMsg] param err. data = (nil), queue = " + queue + " ",
                            put_end, start, "CMN|[api:BT_CMN_enqueueMsg] param err. data = " + at + ", queue = (nil) ",
                            put_end, began,
                            "CMN|[API][BT_CMN_queueMsg] param err. data = (nil), queue = " + queue + " ", taken, began,
                            "CMN|[API][BT_CMN_queueMsg] param err. data = " + at + ", queue = (nil) ", taken));
}

TEST_F(EventQueue, TakenEventsAreTraced)
{
    add(7);
    DebugSRVOutLogSts = DebugConsoleLogSts = 1;
    testing::internal::CaptureStdout();
    BtMessage buffer;
    BT_CMN_queueMsg(&buffer, head());
    std::fflush(stdout);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "BTSRV 0007 \n");
    DebugSRVOutLogSts = DebugConsoleLogSts = 0;
}

// ---- timers

TEST(Timers, PassTheOwnNumberAndLogFailures)
{
    LogCapture log;
    fake::reset();
    fake::set_pno(0x08C2);
    BT_CMN_startTimer(17, 2500);
    BT_CMN_stopTimer(18);
    ASSERT_EQ(fake::timers().size(), 2u);
    const fake::TimerCall &start = fake::timers()[0], &stop = fake::timers()[1];
    EXPECT_EQ(start.call, "start");
    EXPECT_THAT((std::vector<uint32_t>{start.pno, start.timer_id, start.two, start.time}),
                ElementsAre(0x08C2u, 17u, 2u, 2500u));
    EXPECT_EQ(stop.call, "stop");
    EXPECT_THAT((std::vector<uint32_t>{stop.pno, stop.timer_id, stop.two}), ElementsAre(0x08C2u, 18u, 2u));
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_startTimer", "CMN|[API][END] BT_CMN_startTimer",
                            "CMN|[API][START] BT_CMN_stopTimer", "CMN|[API][END] BT_CMN_stopTimer"));
    EXPECT_TRUE(fake::logs().empty());

    fake::answer_timer(-7);
    BT_CMN_startTimer(1, 1);
    BT_CMN_stopTimer(1);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_startTimer", "CMN|[api:BT_CMN_startTimer] api_ret = -7",
                            "CMN|[API][END] BT_CMN_startTimer", "CMN|[API][START] BT_CMN_stopTimer",
                            "CMN|[api:BT_CMN_stopTimer] api_ret = -7", "CMN|[API][END] BT_CMN_stopTimer"));
    ASSERT_EQ(fake::logs().size(), 2u);
    EXPECT_EQ(fake::logs()[0].text, "TOVAK_BT CMN - _sys_ReqTimerStart() error : api_ret = -7");
    EXPECT_EQ(fake::logs()[1].text, "TOVAK_BT CMN - _sys_TimerStop() error : api_ret = -7");
    EXPECT_EQ(fake::logs()[0].tag, "BT_CMN_startTimer");
    EXPECT_EQ(fake::logs()[1].tag, "BT_CMN_stopTimer");
    EXPECT_EQ(fake::logs()[0].numbers[0], 4);
}

// ---- shared memory objects

class SharedMemory : public testing::Test {
protected:
    SharedMemory()
    {
        std::snprintf(name_, sizeof name_, "/bt_unit_shm_%d", getpid());
        handle_.name = name_;
        handle_.size = 100;
        handle_.fd = -1;
    }
    ~SharedMemory() override { shm_unlink(name_); }
    bool exists() const
    {
        const int descriptor = shm_open(name_, O_RDWR, 0);
        if (descriptor >= 0) close(descriptor);
        return descriptor >= 0;
    }
    char name_[64];
    BtShmHandle handle_{};
};

TEST_F(SharedMemory, ObjectLivesUntilItIsDestroyed)
{
    LogCapture log;
    ASSERT_EQ(BT_CMN_createShm(&handle_), 0u);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_createShm", "CMN|[API][END] BT_CMN_createShm "));
    std::memcpy(handle_.addr, "kept", 4);
    void* const first = handle_.addr;
    ASSERT_EQ(BT_CMN_openShm(&handle_), 0u);
    EXPECT_THAT(LogCapture::texts(), ElementsAre("CMN|[API][START] BT_CMN_openShm", "CMN|[API][END] BT_CMN_openShm "));
    EXPECT_EQ(std::memcmp(handle_.addr, "kept", 4), 0);
    munmap(first, 100);
    const int descriptor = handle_.fd;
    void* const mapped = handle_.addr;
    EXPECT_EQ(BT_CMN_closeShm(&handle_), 0u);
    EXPECT_EQ(handle_.fd, descriptor);
    EXPECT_EQ(handle_.addr, mapped);
    EXPECT_EQ(fcntl(descriptor, F_GETFD), -1) << "closed";
    EXPECT_TRUE(exists());
    EXPECT_TRUE(LogCapture::texts().empty()) << "closing writes no line";

    BtShmHandle again{name_, 5000, -1, nullptr};
    ASSERT_EQ(BT_CMN_createShm(&again), 0u);
    struct stat status;
    ASSERT_EQ(fstat(again.fd, &status), 0);
    EXPECT_EQ(status.st_size, 5000);
    EXPECT_EQ(std::memcmp(again.addr, "kept", 4), 0);
    LogCapture::lines().clear();
    EXPECT_EQ(BT_CMN_destroyShm(&again), 0u);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_destroyShm", "CMN|[API][END] BT_CMN_destroyShm "));
    EXPECT_EQ(again.addr, nullptr);
    EXPECT_FALSE(exists());
}

TEST_F(SharedMemory, FailuresLeaveTheHandleAlone)
{
    LogCapture log;
    using Lines = std::vector<std::string>;
    const auto null_line = [](const char* name) {
        return "CMN|[api:" + std::string(name) + "] param err. fd = (nil) ";
    };
    EXPECT_EQ(BT_CMN_createShm(nullptr), 1u);
    EXPECT_EQ(LogCapture::texts(), (Lines{"CMN|[API][START] BT_CMN_createShm", null_line("BT_CMN_createShm")}));
    EXPECT_EQ(BT_CMN_openShm(nullptr), 1u);
    EXPECT_THAT(LogCapture::texts(), testing::Contains(null_line("BT_CMN_openShm")));
    EXPECT_EQ(BT_CMN_closeShm(nullptr), 1u);
    EXPECT_EQ(LogCapture::texts(), (Lines{null_line("BT_CMN_closeShm")}));
    EXPECT_EQ(BT_CMN_destroyShm(nullptr), 1u);
    EXPECT_EQ(LogCapture::texts(), (Lines{"CMN|[API][START] BT_CMN_destroyShm", null_line("BT_CMN_destroyShm")}));

    BtShmHandle bad{"/no/such/name", 10, -5, nullptr};
    EXPECT_EQ(BT_CMN_createShm(&bad), 1u);
    EXPECT_EQ(LogCapture::texts(),
              (Lines{"CMN|[API][START] BT_CMN_createShm", "CMN|[api:BT_CMN_createShm] shm_open err. fd = -1 "}));
    EXPECT_EQ(bad.fd, -5);

    // Mapping nothing fails; the descriptor opened on the way does not leak.
    const int next = open("/dev/null", O_RDONLY);
    close(next);
    handle_.size = 0;
    EXPECT_EQ(BT_CMN_createShm(&handle_), 1u);
    EXPECT_EQ(LogCapture::texts(),
              (Lines{"CMN|[API][START] BT_CMN_createShm",
                     "CMN|[api:BT_CMN_createShm] mmap err. addr = 0x" + std::string(2 * sizeof(void*), 'f') + " "}));
    EXPECT_EQ(handle_.fd, -1);
    EXPECT_EQ(handle_.addr, nullptr);
    EXPECT_EQ(fcntl(next, F_GETFD), -1);

    handle_.size = 100;
    ASSERT_EQ(BT_CMN_createShm(&handle_), 0u);
    munmap(handle_.addr, 100);
    handle_.addr = nullptr;
    LogCapture::lines().clear();
    EXPECT_EQ(BT_CMN_destroyShm(&handle_), 1u);
    EXPECT_EQ(LogCapture::texts(), (Lines{"CMN|[API][START] BT_CMN_destroyShm", null_line("BT_CMN_destroyShm")}));
    EXPECT_EQ(fcntl(handle_.fd, F_GETFD), -1) << "closed all the same";
    EXPECT_TRUE(exists());
    EXPECT_EQ(BT_CMN_openShm(&handle_), 1u) << "the descriptor is closed";
}

// ---- byte order

TEST(ByteOrder, WritesAndReadsAtAnyAddress)
{
    LogCapture log;
    struct Row {
        const char* name;
        std::function<void(uint8_t*)> write;
        std::function<uint32_t(const uint8_t*)> read;
        fake::Bytes bytes;
        uint32_t value;
        const char *written, *shown;
    };
    const Row rows[] = {{"LONG2BIG",
                         [](uint8_t* o) { BT_CMN_LONG2BIG(0x01020304, o); },
                         BT_CMN_BIG2LONG,
                         {1, 2, 3, 4},
                         0x01020304,
                         "01020304",
                         "0x1020304"},
                        {"LONG2LITTLE",
                         [](uint8_t* o) { BT_CMN_LONG2LITTLE(0x010203FE, o); },
                         BT_CMN_LITTLE2LONG,
                         {0xFE, 3, 2, 1},
                         0x010203FE,
                         "fe030201",
                         "0x10203fe"},
                        {"SHORT2BIG",
                         [](uint8_t* o) { BT_CMN_SHORT2BIG(0xABCD, o); },
                         BT_CMN_BIG2SHORT,
                         {0xAB, 0xCD},
                         0xABCD,
                         "abcd",
                         "0xabcd"},
                        {"SHORT2LITTLE",
                         [](uint8_t* o) { BT_CMN_SHORT2LITTLE(0x0005, o); },
                         BT_CMN_LITTLE2SHORT,
                         {5, 0},
                         5,
                         "0500",
                         "0x05"}};
    const char* const readers[] = {"BIG2LONG", "LITTLE2LONG", "BIG2SHORT", "LITTLE2SHORT"};
    for (size_t i = 0; i < 4; ++i) {
        const Row& row = rows[i];
        const std::string name = std::string("BT_CMN_") + row.name, reader = std::string("BT_CMN_") + readers[i];
        for (uint32_t shift = 0; shift < 4; ++shift) {
            const auto width = static_cast<uint32_t>(row.bytes.size());
            uint8_t* const at = fake::guarded(width + shift);
            row.write(at + shift);
            EXPECT_EQ(fake::Bytes(at + shift, at + shift + width), row.bytes) << name;
            EXPECT_EQ(row.read(at + shift), row.value) << reader;
            EXPECT_THAT(LogCapture::texts(),
                        ElementsAre("CMN|[API][START] " + name, "CMN|[API][END] " + name + " (" + row.written + ")",
                                    "CMN|[API][START] " + reader, "CMN|[API][END] " + reader + " (" + row.shown + ")"));
        }
        row.write(nullptr);
        EXPECT_EQ(row.read(nullptr), 0u);
        const auto texts = LogCapture::texts();
        EXPECT_THAT(texts, testing::Contains("CMN|[api:" + name + "] param err. output = (nil) "));
        EXPECT_THAT(texts, testing::Contains("CMN|[api:" + reader + "] param err. input = (nil) "));
        EXPECT_EQ(texts.front(), "CMN|[API][START] " + name);
    }
    fake::reset();
}

} // namespace
