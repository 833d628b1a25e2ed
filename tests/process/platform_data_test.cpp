// Named shared data and named locks.
#include "platform_fixture.h"

#include <thread>

namespace bt::test {
namespace {

using PlatformData = Domain;
using PlatformLocks = Domain;

TEST_F(PlatformData, SizeWordIsInAndOut)
{
    ASSERT_EQ(bt_host_create_data("/tmp/shm_x", 348), 0);
    void* const linked = link_data("/tmp/shm_x");
    const std::tuple<const char*, uint32_t, int32_t, uint32_t> rows[] = {
        {"/tmp/shm_x", 0, 0, 348},
        {"/tmp/shm_x", 348, 0, 348},
        {"/tmp/shm_x", 349, 2, 349},
        {"/tmp/shm_x", UINT32_MAX, 2, UINT32_MAX},
        {"_tmp_shm_x", 0, 1, 0},
        {"/tmp/shm_", 0, 1, 0},
        {"", 0, -1, 0},
        {nullptr, 0, -1, 0},
    };
    for (const auto& [data, asked, result, told] : rows) {
        void* address = this;
        uint32_t size = asked;
        EXPECT_EQ(_sys_LinkShareData(data, &address, &size), result) << bt_host_error();
        EXPECT_EQ(address, result == 0 ? linked : nullptr);
        EXPECT_EQ(size, told);
    }
    EXPECT_EQ(_sys_LinkShareData("/tmp/shm_x", nullptr, nullptr), -1);
}

TEST_F(PlatformData, EveryProcessSeesTheSameBytesUntilTheDataIsRemoved)
{
    ASSERT_EQ(bt_host_create_data("D", 5000), 0);
    auto* const bytes = static_cast<uint8_t*>(link_data("D"));
    EXPECT_EQ(std::count(bytes, bytes + 5000, 0), 5000);
    EXPECT_TRUE(in_child([bytes] {
        bytes[0] = 1;
        bytes[4999] = 2;
        EXPECT_EQ(bt_host_create_data("D", 5000), 1) << "content kept";
        EXPECT_EQ(bt_host_create_data("D", 4999), -1) << "another size";
        EXPECT_EQ(bt_host_remove_data("D"), 0);
    }));
    void* address = nullptr;
    uint32_t size = 0;
    EXPECT_EQ(_sys_LinkShareData("D", &address, &size), 1);
    EXPECT_EQ(bytes[0] + bytes[4999], 3) << "a link made before stays valid";
    EXPECT_TRUE(in_child([] { EXPECT_EQ(bt_host_create_data("D", 9000), 0); }));
    EXPECT_EQ(*static_cast<uint8_t*>(link_data("D", &size)), 0);
    EXPECT_EQ(size, 9000U);
    EXPECT_EQ(bt_host_remove_data("D"), 0);
    EXPECT_EQ(bt_host_remove_data("D"), -1);
}

TEST_F(PlatformData, NamesOfAnyKindStayApart)
{
    const std::string longest(BT_HOST_NAME_MAX - 1, '/');
    const std::string names[] = {"a/b", "a_b", "a%2Fb", "a.b", "A_B", "ü b", longest, longest.substr(1)};
    uint32_t size = 1;
    for (const std::string& data : names)
        ASSERT_EQ(bt_host_create_data(data.c_str(), size++), 0) << data << ": " << bt_host_error();

    BtHostData listed[16];
    ASSERT_EQ(bt_host_list_data(listed, 16), 8);
    for (uint32_t at = 0; at < 8; ++at) {
        EXPECT_EQ(listed[at].name, names[at]);
        EXPECT_EQ(listed[at].size, at + 1);
    }
    EXPECT_EQ(bt_host_list_data(listed, 3), 3);
    EXPECT_EQ(bt_host_create_data((longest + "/").c_str(), 1), -1);
    EXPECT_EQ(bt_host_create_data("zero", 0), -1);
    EXPECT_EQ(bt_host_create_data("huge", UINT32_MAX), -1);
}

TEST_F(PlatformLocks, HandleIsOneForEachName)
{
    const uint32_t one = _sys_CreateSemaphore("ONE");
    EXPECT_NE(one, 0U);
    EXPECT_NE(_sys_CreateSemaphore("TWO"), one);
    EXPECT_EQ(_sys_CreateSemaphore("ONE"), one);
    EXPECT_EQ(_sys_CreateSemaphore(nullptr), 0U);
    EXPECT_EQ(_sys_CreateSemaphore(""), 0U);
    EXPECT_EQ(_sys_CreateSemaphore(std::string(BT_HOST_NAME_MAX, 'x').c_str()), 0U);
    for (const uint32_t unknown : {0U, 100000U, UINT32_MAX}) {
        EXPECT_NE(_sys_SemLock(unknown), 0);
        EXPECT_NE(_sys_SemUnlock(unknown), 0);
    }
}

TEST_F(PlatformLocks, OnlyTheHoldingThreadUnlocksAndNobodyWaitsForEver)
{
    const uint32_t lock = _sys_CreateSemaphore("L");
    EXPECT_NE(_sys_SemUnlock(lock), 0) << "free";
    ASSERT_EQ(_sys_SemLock(lock), 0);
    EXPECT_NE(_sys_SemLock(lock), 0) << "twice by one thread";
    std::thread([lock] { EXPECT_NE(_sys_SemUnlock(lock), 0); }).join();
    EXPECT_TRUE(in_child([lock] {
        EXPECT_NE(_sys_SemUnlock(lock), 0);
        EXPECT_NE(_sys_SemLock(lock), 0);
        EXPECT_TRUE(error_names(std::to_string(getppid()))) << bt_host_error();
        EXPECT_NE(_sys_SemUnlock(lock), 0) << "the unlock after a failed lock takes it from nobody";
    }));
    EXPECT_EQ(first_lock().holder_pid, static_cast<uint32_t>(getpid()));
    EXPECT_EQ(_sys_SemUnlock(lock), 0);
    EXPECT_NE(_sys_SemUnlock(lock), 0);
    EXPECT_TRUE(in_child([lock] { EXPECT_EQ(_sys_SemLock(lock), 0); })) << "no stray unlock did harm";
}

} // namespace
} // namespace bt::test
