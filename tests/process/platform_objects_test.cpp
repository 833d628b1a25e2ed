// Objects that somebody else made, cut, overwrote or left unfinished.
#include "platform_fixture.h"

#include "../../platform/posix/domain.h"
#include "../../platform/posix/ring.h"

#include <gmock/gmock.h>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>

namespace bt::test {
namespace {

using platform::Kind;

// An object as anybody with its owner's rights can reach it.
struct Raw {
    explicit Raw(const std::string& name) : fd(shm_open(name.c_str(), O_RDWR, 0))
    {
        struct stat file {};
        if (fd < 0 || fstat(fd, &file) != 0) std::abort();
        whole.resize(static_cast<size_t>(file.st_size));
        if (pread(fd, whole.data(), whole.size(), 0) != file.st_size) std::abort();
        memory = mmap(nullptr, whole.size(), PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    }
    ~Raw()
    {
        munmap(memory, whole.size());
        close(fd);
    }
    Raw(const Raw&) = delete;
    Raw& operator=(const Raw&) = delete;

    void mend() const
    {
        EXPECT_EQ(fchown(fd, geteuid(), getegid()) | fchmod(fd, 0600), 0);
        EXPECT_EQ(pwrite(fd, whole.data(), whole.size(), 0), static_cast<ssize_t>(whole.size()));
    }

    template <class T>
    T& as() const
    {
        return *static_cast<T*>(memory);
    }
    platform::Stamp& stamp() const { return as<platform::Stamp>(); }

    const int fd;
    std::string whole;
    void* memory;
};

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

    const std::string domain = "/bt." + name + ".domain";
    const std::string queue = "/bt." + name + ".queue.08C1";
    const std::string data = "/bt." + name + ".data.%2Ftmp%2FD";
};

// One process that posts and links; both have that result.
bool use_gives(int32_t posted, int32_t linked)
{
    return in_child([=] {
        void* address = nullptr;
        EXPECT_EQ(post(Numbered()), posted) << bt_host_error();
        EXPECT_EQ(_sys_LinkShareData("/tmp/D", &address, nullptr), linked) << bt_host_error();
    });
}

TEST_F(PlatformObjects, ForeignAndCutOnesAreRefusedByNameWithTheReason)
{
    const std::pair<const char*, void (*)(const Raw&)> rows[] = {
        {"mode 0666", [](const Raw& o) { fchmod(o.fd, 0666); }},
        {"mode 0640", [](const Raw& o) { fchmod(o.fd, 0640); }},
        {"belongs to user 1", [](const Raw& o) { EXPECT_EQ(fchown(o.fd, 1, 0), 0); }},
        {"not what its name says", [](const Raw& o) { ++o.stamp().magic; }},
        {"not what its name says", [](const Raw& o) { o.stamp().kind += 5; }},
        {"layout version 2", [](const Raw& o) { o.stamp().version = 2; }},
        {"made by a 16-bit program", [](const Raw& o) { o.stamp().word_size = 2; }},
        {"stamped with", [](const Raw& o) { ++o.stamp().size; }},
        {" 1 bytes", [](const Raw& o) { EXPECT_EQ(ftruncate(o.fd, 1), 0); }},
        {" 63 bytes", [](const Raw& o) { EXPECT_EQ(ftruncate(o.fd, 63), 0); }},
        {"has 65", [](const Raw& o) { EXPECT_EQ(ftruncate(o.fd, 65), 0); }},
    };
    for (const std::string& object : {domain, queue, data}) {
        for (const auto& [reason, spoil] : rows) {
            if (geteuid() != 0 && std::strstr(reason, "user 1") != nullptr) continue;
            const Raw raw(object);
            spoil(raw);
            EXPECT_TRUE(in_child([&, reason = reason] {
                void* address = nullptr;
                EXPECT_EQ(object == data ? _sys_LinkShareData("/tmp/D", &address, nullptr) : post(Numbered()), -1);
                EXPECT_THAT(bt_host_error(), testing::ContainsRegex(object + ".*" + reason + ".*; "));
            })) << reason;
            raw.mend();
            EXPECT_TRUE(use_gives(0, 0)) << reason;
        }
    }
}

TEST_F(PlatformObjects, UnfinishedOnesCountAsAbsentAndAreMadeAnew)
{
    Raw(queue).stamp().ready = 0;
    Raw(data).stamp().ready = 0;
    EXPECT_TRUE(use_gives(1, 1));
    const auto make_both = [] {
        EXPECT_EQ(bt_host_claim_pno(kPno), 0) << bt_host_error();
        EXPECT_EQ(bt_host_create_data("/tmp/D", 50), 0) << bt_host_error();
    };
    EXPECT_TRUE(in_child(make_both));
    EXPECT_TRUE(use_gives(0, 0));

    Raw(domain).stamp().ready = 0;
    EXPECT_TRUE(use_gives(-1, -1));
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_create_domain(), 0) << bt_host_error(); }));
    EXPECT_TRUE(in_child(make_both)) << "over the former domain's objects";
    EXPECT_TRUE(use_gives(0, 0));
}

TEST_F(PlatformObjects, UnusableDomainCanBeRemovedByItsOwnerOnly)
{
    Raw(domain).stamp().version = 99;
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_create_domain(), -1); }));
    if (geteuid() == 0) {
        ASSERT_EQ(fchown(Raw(domain).fd, 1, 0), 0);
        EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), -1); }));
        ASSERT_EQ(fchown(Raw(domain).fd, 0, 0), 0);
    }
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_remove_domain(), 0) << bt_host_error(); }));
    for (const std::string& object : {domain, queue, data})
        EXPECT_EQ(shm_open(object.c_str(), O_RDWR, 0), -1) << object << " went with it";
}

TEST_F(PlatformObjects, NoContentOfAQueueMisleadsOwnerOrSender)
{
    constexpr uint32_t kOdd[] = {0, 1, 15, 255, 256, 257, 1024, 1025, 0x7FFFFFFF, 0x80000000, 0xFFFFFF00, 0xFFFFFFFF};
    ASSERT_TRUE(in_child([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        const Raw raw(queue);
        auto& ring = raw.as<platform::Ring>();
        std::memset(ring.slots, 0x5A, sizeof ring.slots);
        for (uint32_t at = 0; at < 12 * 12 * 12; ++at) {
            const uint32_t head = kOdd[at % 12], tail = kOdd[at / 12 % 12], size = kOdd[at / 144];
            ring.slots[head % platform::kQueueCapacity].size = size;
            ring.head = head;
            ring.tail = tail;
            ring.sleepers = size;
            ASSERT_LE(first_queue().queued, first_queue().capacity);
            for (int taken = 0; taken < 2; ++taken) {
                uint8_t buffer[3000] = {};
                ASSERT_GE(bt_host_receive(buffer, sizeof buffer, 0), 0);
                ASSERT_EQ(std::count(buffer + 1024, std::end(buffer), 0), 3000 - 1024) << "bytes of the next slot";
            }
            const int32_t posted = post(Numbered(7));
            ASSERT_TRUE(posted == 0 || posted == 2) << posted;
        }
        ASSERT_EQ(bt_host_release_pno() | bt_host_claim_pno(kPno) | post(Numbered(8)), 0);
        Numbered message;
        EXPECT_EQ(receive(&message, 0), 1);
        EXPECT_EQ(message.words[0], 8U) << "a new owner starts with a sane queue";
    }));
}

// What a sender that is stopped or killed at its worst moments leaves behind, made by hand.
TEST_F(PlatformObjects, SenderStoppedOrKilledInTheMiddleBlocksNobodyForLong)
{
    const Raw raw(queue);
    auto& ring = raw.as<platform::Ring>();
    Child holder([&] {
        ASSERT_EQ(pthread_mutex_lock(&ring.lock), 0);
        stand();
    });
    hear(holder.line);
    EXPECT_EQ(post(Numbered()), 4);
    first_queue(); // listing does not need the lock
    holder.end(SIGKILL);
    EXPECT_EQ(post(Numbered()), 0) << bt_host_error();

    Child receiver([] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0);
        Numbered message;
        for (int expected = 2; expected > 0; --expected)
            EXPECT_EQ(_sys_RcvMsg(kPno, sizeof message, &message, 0), 1);
    });
    while (ring.sleepers == 0)
        sched_yield();
    ++ring.tail; // posted by somebody who died before ringing
    EXPECT_EQ(receiver.end(), 0);
}

TEST_F(PlatformObjects, NoContentOfTheDomainMisleads)
{
    ASSERT_TRUE(in_child([&] {
        ASSERT_EQ(bt_host_claim_pno(kPno), 0); // maps the domain before its lists are spoiled
        const Raw raw(domain);
        auto& area = raw.as<platform::DomainArea>();
        std::memset(area.entries, 0xFF, sizeof area.entries);
        for (auto& lock : area.locks)
            std::memset(lock.name, 0xFF, sizeof lock.name);
        area.entries[3].kind = static_cast<uint32_t>(Kind::data);
        area.entries[4].kind = static_cast<uint32_t>(Kind::queue);
        area.locks[2].used = 1;
        BtHostData listed{};
        BtHostQueue queues{};
        EXPECT_EQ(bt_host_list_data(&listed, 1), 0);
        EXPECT_EQ(bt_host_list_queues(&queues, 1), 0);
        const BtHostLock lock = first_lock();
        EXPECT_EQ(strnlen(lock.name, sizeof lock.name), sizeof lock.name - 1);
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
} // namespace bt::test
