// Event queue, timers, shared memory objects and byte order.
#include "log_capture.h"

#include <bt_service/bt_byte_order.h>
#include <bt_service/bt_event_queue.h>
#include <bt_service/bt_message.h>
#include <bt_service/bt_shared_memory.h>
#include <bt_service/bt_timer.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>

namespace {

using fake::Bytes;

// ---- event queue

class EventQueue : public testing::Test {
protected:
    EventQueue() { head_.link = &head_; }
    uint32_t add(uint8_t number) { return BT_CMN_enqueueMsg(Bytes(1024, number).data(), &head_); }
    // The number of the event taken, -1 when there was none.
    int take()
    {
        Bytes buffer(1024, 0xEE);
        const uint32_t taken = BT_CMN_queueMsg(buffer.data(), &head_);
        EXPECT_EQ(buffer, Bytes(1024, taken == 0 ? uint8_t{0xEE} : buffer[0]));
        return taken == 0 ? -1 : buffer[0];
    }
    BtQueueNode head_{};
};

TEST_F(EventQueue, FirstInFirstOut)
{
    EXPECT_EQ(take(), -1);
    for (int round = 0; round < 2; ++round) {
        for (uint8_t i = 1; i <= 5; ++i)
            EXPECT_EQ(add(i), 0u);
        EXPECT_EQ(take(), 1);
        EXPECT_EQ(add(6), 0u);
        for (int i = 2; i <= 6; ++i)
            EXPECT_EQ(take(), i);
        EXPECT_EQ(take(), -1);
        EXPECT_EQ(head_.link, &head_);
        EXPECT_THAT(head_.slot, testing::Each(0)) << "the head's slot is cleared";
    }
}

TEST_F(EventQueue, LinesCountTheEvents)
{
    const std::string start = "[API][START] BT_CMN_enqueueMsg", end = "[API][END] BT_CMN_enqueueMsg ";
    const std::string began = "[API][START] BT_CMN_queueMsg", taken = "[API][END] BT_CMN_queueMsg ";
    const std::string place = "[api:BT_CMN_enqueueMsg] ", top = "[api:BT_CMN_queueMsg] dequeued the top event. ";
    const std::string at = pointer_text(this), queue = pointer_text(&head_);
    const struct {
        std::function<void()> call;
        Lines lines;
    } rows[] = {
        {[&] { add(1); }, {start, place + "enqueued into the top. ( event cnt = 1 ) ", end + "(0)"}},
        {[&] { add(2); }, {start, place + "enqueued into the bottom. ( event cnt = 2 ) ", end + "(0)"}},
        {[&] { add(3); }, {start, place + "enqueued into the bottom. ( event cnt = 3 ) ", end + "(0)"}},
        {[&] { take(); }, {began, top + "( event cnt = 2 ) ", taken + "(1)"}},
        {[&] { take(); }, {began, top + "( event cnt = 1 ) ", taken + "(1)"}},
        {[&] { take(); }, {began, top + "( event cnt = 0 ) ", taken + "(1)"}},
        {[&] { take(); }, {began, "[API][BT_CMN_queueMsg] dequeued is empty. ( event cnt = 0 ) ", taken + "(0)"}},
        {[&] { EXPECT_EQ(BT_CMN_enqueueMsg(nullptr, &head_), 1u); },
         {start, place + "param err. data = (nil), queue = " + queue + " ", end + "(1)"}},
        {[&] { EXPECT_EQ(BT_CMN_enqueueMsg(this, nullptr), 1u); },
         {start, place + "param err. data = " + at + ", queue = (nil) ", end + "(1)"}},
        {[&] { EXPECT_EQ(BT_CMN_queueMsg(nullptr, &head_), 1u); },
         {began, "[API][BT_CMN_queueMsg] param err. data = (nil), queue = " + queue + " ", taken + "(1)"}},
        {[&] { EXPECT_EQ(BT_CMN_queueMsg(this, nullptr), 1u); },
         {began, "[API][BT_CMN_queueMsg] param err. data = " + at + ", queue = (nil) ", taken + "(1)"}},
    };
    for (const auto& row : rows)
        EXPECT_EQ(logged("CMN", row.call), row.lines);
}

TEST_F(EventQueue, TakenEventsAreTraced)
{
    head_.link = nullptr; // one event, in the head
    head_.slot[8] = 7;
    Bytes buffer(1024);
    DebugSRVOutLogSts = DebugConsoleLogSts = 1;
    EXPECT_EQ(outputs_of([&] { BT_CMN_queueMsg(buffer.data(), &head_); }).console, "BTSRV 0007 \n");
    DebugSRVOutLogSts = DebugConsoleLogSts = 0;
}

// ---- timers

TEST(Timers, PassTheOwnNumberAndLogFailures)
{
    const struct {
        std::function<void()> call;
        std::string name, platform_call, error;
    } rows[] = {{[] { BT_CMN_startTimer(17, 2500); }, "BT_CMN_startTimer", "ReqTimerStart(2242,17,2,2500)",
                 "TOVAK_BT CMN - _sys_ReqTimerStart() error : api_ret = -7"},
                {[] { BT_CMN_stopTimer(18); }, "BT_CMN_stopTimer", "TimerStop(2242,18,2)",
                 "TOVAK_BT CMN - _sys_TimerStop() error : api_ret = -7"}};
    for (const auto& row : rows) {
        fake::reset();
        const std::string start = "[API][START] " + row.name, end = "[API][END] " + row.name;
        EXPECT_EQ(logged("CMN", row.call), (Lines{start, end}));
        EXPECT_EQ(fake::calls(), Lines{row.platform_call});
        EXPECT_TRUE(fake::logs().empty());
        fake::answer_timer(-7);
        EXPECT_EQ(logged("CMN", row.call), (Lines{start, "[api:" + row.name + "] api_ret = -7", end}));
        ASSERT_EQ(fake::logs().size(), 1u);
        EXPECT_EQ(fake::logs()[0].text, row.error);
        EXPECT_EQ(fake::logs()[0].tag, row.name);
        EXPECT_EQ(fake::logs()[0].numbers[0], 4);
    }
}

// ---- shared memory objects

class SharedMemory : public testing::Test {
protected:
    ~SharedMemory() override { shm_unlink(name_.c_str()); }
    bool exists() const
    {
        const int descriptor = shm_open(name_.c_str(), O_RDWR, 0);
        if (descriptor >= 0) close(descriptor);
        return descriptor >= 0;
    }
    // Asks the kernel, which refuses to read what is not mapped.
    static bool mapped(const void* address)
    {
        int ends[2];
        if (pipe(ends) != 0) return true;
        const bool readable = write(ends[1], address, 1) == 1;
        close(ends[0]);
        close(ends[1]);
        return readable;
    }
    std::string name_ = "/bt_unit_shm_" + std::to_string(getpid());
    BtShmHandle handle_{name_.data(), 100, -1, nullptr};
};

TEST_F(SharedMemory, ObjectLivesUntilItIsDestroyed)
{
    const auto expect_lines = [](const std::string& name, BtShmHandle& handle, uint32_t (*call)(BtShmHandle*)) {
        EXPECT_EQ(logged("CMN", [&] { EXPECT_EQ(call(&handle), 0u); }),
                  (Lines{"[API][START] " + name, "[API][END] " + name + " "}));
    };
    expect_lines("BT_CMN_createShm", handle_, BT_CMN_createShm);
    std::memcpy(handle_.addr, "kept", 4);
    munmap(handle_.addr, 100);
    expect_lines("BT_CMN_openShm", handle_, BT_CMN_openShm);
    EXPECT_EQ(std::memcmp(handle_.addr, "kept", 4), 0);
    const BtShmHandle before = handle_;
    EXPECT_EQ(logged("CMN", [&] { EXPECT_EQ(BT_CMN_closeShm(&handle_), 0u); }), Lines{});
    EXPECT_EQ(handle_.fd, before.fd);
    EXPECT_EQ(handle_.addr, before.addr);
    EXPECT_EQ(fcntl(handle_.fd, F_GETFD), -1) << "closed";
    EXPECT_FALSE(mapped(handle_.addr));
    EXPECT_TRUE(exists());

    BtShmHandle again{name_.data(), 5000, -1, nullptr};
    ASSERT_EQ(BT_CMN_createShm(&again), 0u);
    struct stat status;
    ASSERT_EQ(fstat(again.fd, &status), 0);
    EXPECT_EQ(status.st_size, 5000);
    EXPECT_EQ(status.st_mode & 0700u, 0700u) << "no more than the mask is missing of 0777";
    EXPECT_EQ(std::memcmp(again.addr, "kept", 4), 0);
    void* const former = again.addr;
    expect_lines("BT_CMN_destroyShm", again, BT_CMN_destroyShm);
    EXPECT_EQ(again.addr, nullptr);
    EXPECT_FALSE(mapped(former));
    EXPECT_FALSE(exists());
}

TEST_F(SharedMemory, FailuresLeaveTheHandleAlone)
{
    const auto refused = [](uint32_t (*call)(BtShmHandle*), BtShmHandle* handle) {
        return logged("CMN", [=] { EXPECT_EQ(call(handle), 1u); });
    };
    const std::string create = "[API][START] BT_CMN_createShm", open_one = "[API][START] BT_CMN_openShm",
                      destroy = "[API][START] BT_CMN_destroyShm";
    const std::string all_ones = "0x" + std::string(2 * sizeof(void*), 'f') + " ";
    EXPECT_EQ(refused(BT_CMN_createShm, nullptr), (Lines{create, "[api:BT_CMN_createShm] param err. fd = (nil) "}));
    EXPECT_EQ(refused(BT_CMN_openShm, nullptr), (Lines{open_one, "[api:BT_CMN_openShm] param err. fd = (nil) "}));
    EXPECT_EQ(refused(BT_CMN_closeShm, nullptr), (Lines{"[api:BT_CMN_closeShm] param err. fd = (nil) "}));
    EXPECT_EQ(refused(BT_CMN_destroyShm, nullptr), (Lines{destroy, "[api:BT_CMN_destroyShm] param err. fd = (nil) "}));

    char bad_name[] = "/no/such/name";
    BtShmHandle bad{bad_name, 10, -5, nullptr};
    EXPECT_EQ(refused(BT_CMN_createShm, &bad), (Lines{create, "[api:BT_CMN_createShm] shm_open err. fd = -1 "}));
    EXPECT_EQ(bad.fd, -5);
    fake::with_longest_file(0, [&] {
        EXPECT_EQ(refused(BT_CMN_createShm, &handle_),
                  (Lines{create, "[api:BT_CMN_createShm] ftruncate err. ret = -1 "}));
    });

    // Mapping nothing fails; the descriptor opened on the way does not leak.
    const int next = open("/dev/null", O_RDONLY);
    close(next);
    handle_.size = 0;
    EXPECT_EQ(refused(BT_CMN_createShm, &handle_),
              (Lines{create, "[api:BT_CMN_createShm] mmap err. addr = " + all_ones}));
    EXPECT_EQ(handle_.fd, -1);
    EXPECT_EQ(handle_.addr, nullptr);
    EXPECT_EQ(fcntl(next, F_GETFD), -1);

    for (const auto& [call, lines] :
         {std::pair(&BT_CMN_destroyShm, Lines{destroy}), std::pair(&BT_CMN_closeShm, Lines{})}) {
        handle_.size = 100;
        ASSERT_EQ(BT_CMN_createShm(&handle_), 0u);
        munmap(handle_.addr, 100);
        handle_.addr = nullptr;
        EXPECT_EQ(refused(call, &handle_).size(), lines.size() + 1);
        EXPECT_EQ(fcntl(handle_.fd, F_GETFD), -1) << "closed all the same";
        EXPECT_TRUE(exists());
    }
    EXPECT_EQ(refused(BT_CMN_openShm, &handle_),
              (Lines{open_one, "[api:BT_CMN_openShm] mmap err. addr = " + all_ones}));
}

// ---- byte order

#define WRITTEN_AND_READ(write, value, read)                                                                           \
    "BT_CMN_" #write, [](uint8_t* out) { BT_CMN_##write(value, out); }, "BT_CMN_" #read,                               \
        [](const uint8_t* in) { return uint32_t{BT_CMN_##read(in)}; }, value

TEST(ByteOrder, WritesAndReadsAtAnyAddress)
{
    const struct {
        std::string name;
        void (*write)(uint8_t*);
        std::string reader;
        uint32_t (*read)(const uint8_t*);
        uint32_t value;
        std::string written, shown;
    } rows[] = {
        {WRITTEN_AND_READ(LONG2BIG, 0x01020304, BIG2LONG), "01020304", "0x1020304"},
        {WRITTEN_AND_READ(LONG2LITTLE, 0x010203FE, LITTLE2LONG), "fe030201", "0x10203fe"},
        {WRITTEN_AND_READ(SHORT2BIG, 0xABCD, BIG2SHORT), "abcd", "0xabcd"},
        {WRITTEN_AND_READ(SHORT2LITTLE, 0x0005, LITTLE2SHORT), "0500", "0x05"},
    };
    fake::reset();
    for (const auto& row : rows) {
        const std::string start = "[API][START] " + row.name, end = "[API][END] " + row.name;
        const std::string began = "[API][START] " + row.reader, ended = "[API][END] " + row.reader;
        const Bytes bytes = fake::hex(row.written);
        for (uint32_t shift = 0; shift < 4; ++shift) {
            uint8_t* const at = fake::guarded(static_cast<uint32_t>(bytes.size()) + shift) + shift;
            EXPECT_EQ(logged("CMN", [&] { row.write(at); }), (Lines{start, end + " (" + row.written + ")"}));
            EXPECT_EQ(Bytes(at, at + bytes.size()), bytes);
            EXPECT_EQ(logged("CMN", [&] { EXPECT_EQ(row.read(at), row.value); }),
                      (Lines{began, ended + " (" + row.shown + ")"}));
        }
        EXPECT_EQ(logged("CMN", [&] { row.write(nullptr); }),
                  (Lines{start, "[api:" + row.name + "] param err. output = (nil) ", end + " ()"}));
        EXPECT_THAT(logged("CMN", [&] { EXPECT_EQ(row.read(nullptr), 0u); }),
                    testing::Contains("[api:" + row.reader + "] param err. input = (nil) "));
    }
}

} // namespace
