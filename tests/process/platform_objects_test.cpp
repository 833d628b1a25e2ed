// Objects that somebody else made, cut, overwrote or left unfinished.
#include "platform_fixture.h"

#include "../../platform/posix/domain.h"
#include "../../platform/posix/ring.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>

namespace platform_test {
namespace {

using bt::platform::DomainArea;
using bt::platform::Kind;
using bt::platform::Ring;
using bt::platform::Stamp;

// The test process stays out of the domain, so that each child meets the objects for the first time.
class PlatformObjects : public EmptyDomain {
protected:
    PlatformObjects()
    {
        EXPECT_TRUE(in_child([] {
            ASSERT_EQ(bt_host_create_domain(), 0) << bt_host_error();
            ASSERT_EQ(bt_host_claim_pno(kPno), 0);
            ASSERT_EQ(bt_host_create_data("/tmp/D", 100), 0);
        }));
    }

    std::string object(Kind kind) const
    {
        switch (kind) {
        case Kind::domain:
            return "/bt." + name + ".domain";
        case Kind::queue:
            return "/bt." + name + ".queue.08C1";
        default:
            return "/bt." + name + ".data.%2Ftmp%2FD";
        }
    }
};

// An object as anybody with its owner's rights can reach it.
class Raw {
public:
    explicit Raw(const std::string& name) : fd(shm_open(name.c_str(), O_RDWR, 0))
    {
        struct stat file {};
        if (fd < 0 || fstat(fd, &file) != 0) return;
        size_ = static_cast<size_t>(file.st_size);
        memory_ = mmap(nullptr, size_, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    }
    ~Raw()
    {
        munmap(memory_, size_);
        close(fd);
    }
    Raw(const Raw&) = delete;
    Raw& operator=(const Raw&) = delete;

    Stamp& stamp() { return *static_cast<Stamp*>(memory_); }
    Ring& ring() { return *static_cast<Ring*>(memory_); }
    DomainArea& domain() { return *static_cast<DomainArea*>(memory_); }

    const int fd;

private:
    void* memory_ = MAP_FAILED;
    size_t size_ = 0;
};

int32_t use(Kind kind)
{
    void* address = nullptr;
    return kind == Kind::data ? _sys_LinkShareData("/tmp/D", &address, nullptr) : post(Numbered());
}

TEST_F(PlatformObjects, ForeignOnesAreRefusedByNameWithTheReason)
{
    const struct {
        const char* reason;
        void (*spoil)(Raw& object);
        void (*mend)(Raw& object);
    } rows[] = {
        {"mode 0666", [](Raw& o) { fchmod(o.fd, 0666); }, [](Raw& o) { fchmod(o.fd, 0600); }},
        {"mode 0640", [](Raw& o) { fchmod(o.fd, 0640); }, [](Raw& o) { fchmod(o.fd, 0600); }},
        {"belongs to user 1", [](Raw& o) { EXPECT_EQ(fchown(o.fd, 1, 0), 0); },
         [](Raw& o) { EXPECT_EQ(fchown(o.fd, 0, 0), 0); }},
        {"not what its name says", [](Raw& o) { ++o.stamp().magic; }, [](Raw& o) { --o.stamp().magic; }},
        {"not what its name says", [](Raw& o) { o.stamp().kind += 5; }, [](Raw& o) { o.stamp().kind -= 5; }},
        {"layout version 2", [](Raw& o) { o.stamp().version = 2; }, [](Raw& o) { o.stamp().version = 1; }},
        {"made by a 16-bit program", [](Raw& o) { o.stamp().word_size = 2; },
         [](Raw& o) { o.stamp().word_size = sizeof(void*); }},
        {"stamped with", [](Raw& o) { ++o.stamp().size; }, [](Raw& o) { --o.stamp().size; }},
    };
    for (const Kind kind : {Kind::domain, Kind::queue, Kind::data}) {
        for (const auto& row : rows) {
            if (geteuid() != 0 && std::strstr(row.reason, "user 1") != nullptr) continue;
            Raw raw(object(kind));
            ASSERT_GE(raw.fd, 0);
            row.spoil(raw);
            EXPECT_TRUE(in_child([&] {
                EXPECT_EQ(use(kind), -1);
                const std::string error = bt_host_error();
                EXPECT_NE(error.find(object(kind)), std::string::npos) << error;
                EXPECT_NE(error.find(row.reason), std::string::npos) << error;
                EXPECT_NE(error.find("; "), std::string::npos) << "no remedy: " << error;
            })) << row.reason;
            row.mend(raw);
            EXPECT_TRUE(in_child([&] { EXPECT_EQ(use(kind), 0) << bt_host_error(); })) << row.reason;
        }
    }
}

TEST_F(PlatformObjects, CutOnesAreRefused)
{
    for (const Kind kind : {Kind::domain, Kind::queue, Kind::data}) {
        for (const off_t size : {off_t{1}, off_t{63}, off_t{65}}) {
            Raw raw(object(kind));
            const auto whole = static_cast<off_t>(raw.stamp().size);
            std::string saved(static_cast<size_t>(whole), '\0');
            ASSERT_EQ(pread(raw.fd, saved.data(), saved.size(), 0), whole);
            ASSERT_EQ(ftruncate(raw.fd, size), 0);
            EXPECT_TRUE(in_child([&] {
                EXPECT_EQ(use(kind), -1);
                EXPECT_NE(std::string(bt_host_error()).find("bytes"), std::string::npos) << bt_host_error();
            })) << size;
            ASSERT_EQ(pwrite(raw.fd, saved.data(), saved.size(), 0), whole);
            EXPECT_TRUE(in_child([&] { EXPECT_EQ(use(kind), 0) << bt_host_error(); }));
        }
    }
}

TEST_F(PlatformObjects, UnfinishedOnesCountAsAbsentAndAreMadeAnew)
{
    Raw(object(Kind::queue)).stamp().ready = 0;
    Raw(object(Kind::data)).stamp().ready = 0;
    EXPECT_TRUE(in_child([] {
        EXPECT_EQ(use(Kind::queue), 1);
        EXPECT_EQ(use(Kind::data), 1);
        EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
        EXPECT_EQ(bt_host_create_data("/tmp/D", 50), 0) << bt_host_error();
        EXPECT_EQ(use(Kind::queue), 0);
        EXPECT_EQ(use(Kind::data), 0);
    }));

    Raw(object(Kind::domain)).stamp().ready = 0;
    EXPECT_TRUE(in_child([] {
        EXPECT_EQ(use(Kind::queue), -1);
        EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error();
        EXPECT_EQ(bt_host_claim_pno(kPno), 0) << "over the former domain's queue: " << bt_host_error();
        EXPECT_EQ(bt_host_create_data("/tmp/D", 70), 0) << "over the former domain's data: " << bt_host_error();
        EXPECT_EQ(use(Kind::queue), 0);
        EXPECT_EQ(use(Kind::data), 0);
    }));
}

TEST_F(PlatformObjects, UnusableDomainCanBeRemovedByItsOwnerOnly)
{
    Raw(object(Kind::domain)).stamp().version = 99;
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_create_domain(), -1); }));
    if (geteuid() == 0) {
        ASSERT_EQ(fchown(Raw(object(Kind::domain)).fd, 1, 0), 0);
        EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), -1); }));
        ASSERT_EQ(fchown(Raw(object(Kind::domain)).fd, 0, 0), 0);
    }
    EXPECT_TRUE(in_child([] {
        EXPECT_EQ(bt_host_remove_domain(), 0) << bt_host_error();
        EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error();
    }));
    EXPECT_EQ(shm_open(object(Kind::data).c_str(), O_RDWR, 0), -1) << "what it held went with it";
}

TEST_F(PlatformObjects, NothingOfADomainStaysBehind)
{
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), 0); }));
    for (const Kind kind : {Kind::domain, Kind::queue, Kind::data})
        EXPECT_EQ(shm_open(object(kind).c_str(), O_RDWR, 0), -1) << object(kind);
}

TEST_F(PlatformObjects, NoContentOfAQueueMisleadsOwnerOrSender)
{
    constexpr uint32_t kOdd[] = {0, 1, 15, 255, 256, 257, 1024, 1025, 0x7FFFFFFF, 0x80000000, 0xFFFFFF00, 0xFFFFFFFF};
    ASSERT_TRUE(in_child([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        Raw raw(object(Kind::queue));
        Ring& ring = raw.ring();
        for (const uint32_t tail : kOdd) {
            for (const uint32_t head : kOdd) {
                for (const uint32_t size : kOdd) {
                    ring.slots[head % bt::platform::kQueueCapacity].size = size;
                    ring.head = head;
                    ring.tail = tail;
                    ring.sleepers = size;
                    struct {
                        Numbered message;
                        uint32_t behind = 0x5A5A5A5A;
                    } guarded;
                    BtHostQueue queue{};
                    ASSERT_EQ(bt_host_list_queues(&queue, 1), 1);
                    ASSERT_LE(queue.queued, queue.capacity);
                    for (uint32_t count = 0; count < 2; ++count) {
                        const int32_t result = receive(&guarded.message, 0);
                        ASSERT_TRUE(result == 0 || result == 1);
                        ASSERT_EQ(guarded.behind, 0x5A5A5A5AU);
                    }
                    const int32_t posted = post(Numbered(7));
                    ASSERT_TRUE(posted == 0 || posted == 2) << posted;
                }
            }
        }
        ASSERT_EQ(bt_host_release_pno(), 0);
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);

        ASSERT_EQ(post(Numbered(1)), 0);
        ASSERT_EQ(post(Numbered(2)), 0);
        ring.slots[ring.head % bt::platform::kQueueCapacity].size = UINT32_MAX;
        uint8_t larger[3000];
        ASSERT_EQ(bt_host_receive(larger, sizeof larger, 0), 1);
        for (size_t at = sizeof(Numbered); at < sizeof larger; ++at)
            ASSERT_EQ(larger[at], 0) << "of the next slot";
        Numbered message;
        ASSERT_EQ(receive(&message, 0), 1);

        EXPECT_EQ(post(Numbered(8)), 0) << "a new owner starts with a sane queue";
        EXPECT_EQ(receive(&message, 0), 1);
        EXPECT_EQ(message.words[0], 8U);
    }));
}

// What a sender that is stopped or killed at its worst moments leaves behind, made by hand.
TEST_F(PlatformObjects, SenderStoppedOrKilledInTheMiddleBlocksNobodyForLong)
{
    Line line;
    Child holder([&] {
        Raw raw(object(Kind::queue));
        ASSERT_EQ(pthread_mutex_lock(&raw.ring().lock), 0);
        line.say_to_parent();
        line.hear_parent();
    });
    line.hear_child();
    EXPECT_EQ(post(Numbered()), 4);
    BtHostQueue queue{};
    EXPECT_EQ(bt_host_list_queues(&queue, 1), 1) << "listing does not need the lock";
    holder.kill_now();
    EXPECT_EQ(post(Numbered()), 0) << bt_host_error();
}

TEST_F(PlatformObjects, MessageWithoutItsRingIsFound)
{
    Line line;
    Child receiver([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        line.say_to_parent();
        Numbered message;
        EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), 1);
    });
    line.hear_child();
    Raw raw(object(Kind::queue));
    while (raw.ring().sleepers == 0)
        sched_yield();
    raw.ring().slots[0].size = sizeof(Numbered);
    ++raw.ring().tail; // posted by somebody who died before ringing
    EXPECT_TRUE(receiver.succeeded());
}

TEST_F(PlatformObjects, NoContentOfTheDomainMisleads)
{
    ASSERT_TRUE(in_child([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0); // maps the domain before its lists are spoiled
        Raw raw(object(Kind::domain));
        DomainArea& area = raw.domain();
        for (auto& entry : area.entries)
            std::memset(&entry, 0xFF, sizeof entry);
        for (auto& lock : area.locks)
            std::memset(lock.name, 0xFF, sizeof lock.name);
        area.entries[3].kind = static_cast<uint32_t>(Kind::data);
        area.entries[4].kind = static_cast<uint32_t>(Kind::queue);
        area.locks[2].used = 1;
        BtHostData data[4];
        BtHostQueue queues[4];
        BtHostLock locks[4];
        EXPECT_EQ(bt_host_list_data(data, 4), 0);
        EXPECT_EQ(bt_host_list_queues(queues, 4), 0);
        ASSERT_EQ(bt_host_list_locks(locks, 4), 1);
        EXPECT_EQ(strnlen(locks[0].name, sizeof locks[0].name), sizeof locks[0].name - 1);
        EXPECT_EQ(bt_host_create_data("X", 8), -1) << "no place is free";
    }));
}

TEST_F(PlatformObjects, WhatIsPrintedIntoAClosedStreamReachesNoObject)
{
    EXPECT_TRUE(in_child([] {
        for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
            close(stream);
        EXPECT_EQ(bt_host_claim_pno(kPno + 1), 0);
        for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
            EXPECT_EQ(write(stream, "!", 1), -1);
    }));
}

} // namespace
} // namespace platform_test
