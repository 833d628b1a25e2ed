// What the message access service leaves in shared memory, and the message to push.
#include "fake_platform.h"

#include <bt_service/bt_message_access.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>
#include <functional>

namespace {

using fake::Bytes;
using testing::ElementsAre;

const char* const kMessage = "/tmp/shm_map_getmsg";
const char* const kPush = "/tmp/shm_map_pushmsg";
const char* const kInstances = "/tmp/shm_map_insinfo";
const char* const kObject = "BT_SRV_MAP_SERVICE_INFO";

uint8_t pattern(size_t i)
{
    return static_cast<uint8_t>(i * 7 + i / 251 + 1);
}

uint8_t* patterned_area(const char* name, uint32_t size)
{
    uint8_t* const area = fake::area(name, size);
    for (size_t i = 0; i < size; ++i)
        area[i] = pattern(i);
    return area;
}

void put_word(uint8_t* at, uint32_t value)
{
    std::memcpy(at, &value, sizeof value);
}

// Calls a reader on everything that is not a shared area; it must fail each time and leave `memory` as it was.
void expect_untouched_without_area(const char* name, uint32_t size, const uint8_t* memory, size_t length,
                                   const std::function<int32_t()>& read)
{
    const Bytes before(memory, memory + length);
    EXPECT_EQ(read(), -1) << "not shared";
    fake::null_area(name);
    EXPECT_EQ(read(), -1) << "no address";
    fake::area(name, size, 1);
    fake::fail_only("LinkShareData");
    EXPECT_EQ(read(), -1) << "link fails";
    fake::fail_only("");
    EXPECT_EQ(Bytes(memory, memory + length), before);
    EXPECT_THAT(fake::sizes_asked(), testing::Each(size));
    EXPECT_EQ(fake::calls().size(), 3u);
    fake::remove_area(name);
}

// ---- lists

struct List {
    const char* name;
    uint32_t area_size, start, entry_size, capacity;
    int32_t (*read)(uint32_t*, void*);
    int32_t (*read_some)(uint32_t, uint32_t*, void*);
};

const List kLists[] = {
    {"/tmp/shm_map_msglst", 247216, 16, 1648, 150, BT_SRV_MAP_getMessageListData, BT_SRV_MAP_getMessageListData_ex},
    {"/tmp/shm_map_fldlst", 26004, 4, 260, 100, BT_SRV_MAP_getFolderListData, BT_SRV_MAP_getFolderListData_ex}};
constexpr uint32_t kAll = 0; // instead of a maximum: the plain reader

TEST(MessageAccessResults, ListsAreCopiedAsFarAsTheyGo)
{
    for (const List& list : kLists) {
        const uint32_t full = list.capacity;
        const struct {
            uint32_t stored, maximum, copied;
        } rows[] = {{0, kAll, 0},
                    {3, kAll, 3},
                    {full, kAll, full},
                    {full + 1, kAll, full},
                    {0x80000000, kAll, full},
                    {0xFFFFFFFF, kAll, full},
                    {3, 10, 3},
                    {full, 10, 10},
                    {10, 10, 10},
                    {full, 1, 1},
                    {0, 10, 0},
                    {full, full + 1, full},
                    {full + 1, full + 1, full},
                    {0xFFFFFFFF, 0x80000000, full},
                    {0xFFFFFFFF, 0xFFFFFFFF, full},
                    {0xFFFFFFFF, 2, 2}};
        for (const auto& row : rows) {
            SCOPED_TRACE(testing::Message() << list.name << " " << row.stored << " at most " << row.maximum);
            fake::reset();
            uint8_t* const area = patterned_area(list.name, list.area_size);
            put_word(area, row.stored);
            const uint32_t size = row.copied * list.entry_size;
            uint8_t* const entries = fake::guarded(size);
            auto* const count = reinterpret_cast<uint32_t*>(fake::guarded(4));
            EXPECT_EQ(row.maximum == kAll ? list.read(count, entries) : list.read_some(row.maximum, count, entries), 0);
            EXPECT_EQ(*count, row.copied);
            EXPECT_EQ(std::memcmp(entries, area + list.start, size), 0);
            EXPECT_THAT(fake::sizes_asked(), ElementsAre(list.area_size));
        }
    }
}

TEST(MessageAccessResults, ListsRefuseNullsAndZeroWithoutLinking)
{
    for (const List& list : kLists) {
        fake::reset();
        fake::area(list.name, list.area_size);
        uint32_t count = 77;
        uint8_t entry = 0;
        EXPECT_EQ(list.read(nullptr, &entry), -1);
        EXPECT_EQ(list.read(&count, nullptr), -1);
        EXPECT_EQ(list.read_some(1, nullptr, &entry), -1);
        EXPECT_EQ(list.read_some(1, &count, nullptr), -1);
        EXPECT_EQ(list.read_some(0, &count, &entry), -1);
        EXPECT_EQ(count, 77u);
        EXPECT_TRUE(fake::calls().empty());

        for (const uint32_t maximum : {kAll, 1u}) {
            fake::reset();
            auto* const out = fake::guarded(4 + list.entry_size);
            auto* const word = reinterpret_cast<uint32_t*>(out);
            expect_untouched_without_area(list.name, list.area_size, out, 4 + list.entry_size, [&] {
                return maximum == kAll ? list.read(word, out + 4) : list.read_some(maximum, word, out + 4);
            });
        }
    }
}

// ---- the fetched message

struct Fetched {
    explicit Fetched(uint32_t body_size) : body(fake::guarded(body_size)) { record->body = body; }

    uint8_t* const body;
    uint8_t* const bytes = fake::guarded(sizeof(message_record));
    message_record* const record = reinterpret_cast<message_record*>(bytes);
};

int32_t fetch(uint32_t maximum, message_record* record)
{
    return maximum == kAll ? BT_SRV_MAP_getMessageData(record) : BT_SRV_MAP_getMessageData_ex(maximum, record);
}

TEST(MessageAccessResults, MessageIsCopiedWithItsBody)
{
    static_assert(offsetof(message_record, body) == (sizeof(void*) == 8 ? 8168 : 8164));
    const uint32_t usual = 73713;
    const struct {
        uint32_t size, reported, stored, maximum, copied;
    } rows[] = {
        {usual, usual, 0, kAll, 0},
        {usual, usual, 500, kAll, 500},
        {usual, usual, 65541, kAll, 65541},
        {usual, usual, 65542, kAll, 65541},
        {usual, usual, 0x80000000, kAll, 65541},
        {usual, usual, 0xFFFFFFFF, kAll, 65541},
        {usual, usual, 500, 100, 100},
        {usual, usual, 100, 500, 100},
        {usual, usual, 500, 1, 1},
        {usual, usual, 0, 1, 0},
        {usual, usual, 65542, 65542, 65541},
        {usual, usual, 0xFFFFFFFF, 0xFFFFFFFF, 65541},
        {usual, usual, 0xFFFFFFFF, 7, 7},
        {80000, 80000, 0xFFFFFFFF, kAll, 71828}, // a larger area
        {80000, 80000, 70000, 71000, 70000},
        {usual, 0, 0xFFFFFFFF, kAll, 65541}, // the size it asked for counts
        {usual, 0, 500, kAll, 500},
        {usual, 8173, 500, kAll, 1}, // reported smaller than asked
        {usual, 8172, 500, 500, 0},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::Message() << row.size << "/" << row.reported << " body " << row.stored << " at most "
                                        << row.maximum);
        fake::reset();
        uint8_t* const area = patterned_area(kMessage, row.size);
        put_word(area + 8160, row.stored);
        fake::report_size(kMessage, row.reported);
        const Fetched got(row.copied);
        ASSERT_EQ(fetch(row.maximum, got.record), 0);

        EXPECT_EQ(got.record->body_length, row.copied);
        EXPECT_EQ(got.record->body, got.body) << "the caller's own";
        EXPECT_EQ(std::memcmp(got.bytes, area + 4, 8156), 0);
        EXPECT_EQ(std::memcmp(got.bytes + 8160, area + 8164, 4), 0) << "attributes 3 and 4";
        EXPECT_EQ(std::memcmp(got.body, area + 8172, row.copied), 0);
        EXPECT_THAT(fake::sizes_asked(), ElementsAre(usual));
    }
}

TEST(MessageAccessResults, MessageInTooSmallAnAreaHasNoBody)
{
    for (const uint32_t reported : {1u, 8171u}) {
        fake::reset();
        put_word(patterned_area(kMessage, 73713) + 8160, 0xFFFFFFFF);
        fake::report_size(kMessage, reported);
        const Fetched got(0);
        got.record->body_length = 0;
        BT_SRV_MAP_getMessageData(got.record); // may refuse or not
        EXPECT_EQ(got.record->body_length, 0u);
    }
}

TEST(MessageAccessResults, MessageRefusals)
{
    for (const uint32_t maximum : {kAll, 5u}) {
        fake::reset();
        const Fetched got(5);
        expect_untouched_without_area(kMessage, 73713, got.bytes, sizeof *got.record,
                                      [&] { return fetch(maximum, got.record); });
        fake::reset();
        uint8_t* const area = patterned_area(kMessage, 73713);
        put_word(area + 8160, 1);
        EXPECT_EQ(fetch(maximum, nullptr), -1);
        EXPECT_EQ(BT_SRV_MAP_getMessageData_ex(0, nullptr), -1);
        message_record record{};
        EXPECT_EQ(BT_SRV_MAP_getMessageData_ex(0, &record), -1);
        EXPECT_TRUE(fake::calls().empty());
        EXPECT_EQ(fetch(maximum, &record), -1) << "no place for the body";
        const message_record zero{};
        EXPECT_EQ(std::memcmp(&record, &zero, sizeof record), 0);
        put_word(area + 8160, 0);
        EXPECT_EQ(fetch(maximum, &record), 0) << "no body";
        EXPECT_EQ(std::memcmp(&record, area + 4, 8156), 0);
    }
}

// ---- the message to push

push_record pushed(const uint8_t* body, uint32_t length)
{
    push_record record;
    auto* const bytes = reinterpret_cast<uint8_t*>(&record);
    for (size_t i = 0; i < sizeof record; ++i)
        bytes[i] = pattern(i);
    record.body = body;
    record.body_length = length;
    return record;
}

TEST(MessageAccessResults, PushFillsTheAreaButForTheUnusedGroups)
{
    const struct {
        uint32_t size, reported, length, stored;
    } rows[] = {{9652, 9652, 0, 0},       {9652, 9652, 1499, 1499},   {9652, 9652, 1500, 1500},
                {9652, 9652, 1501, 1500}, {9652, 9652, 2000, 1500},   {9652, 9652, 0x80000000, 1500},
                {9652, 9652, ~0u, 1500},  {12000, 12000, 5000, 3848}, {12000, 12000, 3848, 3848},
                {9652, 0, ~0u, 1500},     {9652, 0, 12, 12},          {9652, 8153, 12, 1},
                {9652, 8152, 12, 0}};
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::Message() << row.size << "/" << row.reported << " body " << row.length);
        fake::reset();
        uint8_t* const area = fake::area(kPush, row.size, 0xDD);
        fake::report_size(kPush, row.reported);
        const uint8_t* const body = fake::guarded(row.stored, 0xB0);
        const push_record record = pushed(body, row.length);
        Bytes expected(row.size, 0xDD);
        std::memcpy(&expected[0], &record, 2628);
        std::memcpy(&expected[7876], reinterpret_cast<const uint8_t*>(&record) + 7876, 272);
        put_word(&expected[8140], row.stored);
        put_word(&expected[8148], static_cast<uint32_t>(reinterpret_cast<uintptr_t>(area) + 8152));
        std::fill_n(expected.begin() + 8152, row.stored, uint8_t{0xB0});

        EXPECT_EQ(BT_SRV_MAP_setPushMessageData(record), 0);
        EXPECT_TRUE(Bytes(area, area + row.size) == expected);
        EXPECT_THAT(fake::calls(), ElementsAre("LinkShareData(" + std::string(kPush) + ")"));
        EXPECT_THAT(fake::sizes_asked(), ElementsAre(9652u));
    }
}

TEST(MessageAccessResults, PushRefusals)
{
    fake::reset();
    const uint8_t body = 1;
    expect_untouched_without_area(kPush, 9652, &body, 1,
                                  [&] { return BT_SRV_MAP_setPushMessageData(pushed(&body, 1)); });
    const uint8_t* const area = fake::area(kPush, 9652, 0xDD);
    fake::fail_only("LinkShareData");
    EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(&body, 1)), -1) << "though there is an address";
    fake::fail_only("");
    EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(nullptr, 1)), -1);
    EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(nullptr, ~0u)), -1);
    EXPECT_EQ(Bytes(area, area + 9652), Bytes(9652, 0xDD));
    EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(nullptr, 0)), 0);
    EXPECT_TRUE(fake::posts().empty());
}

// ---- server instances

TEST(MessageAccessResults, InstancesAreCopiedWithTheirNames)
{
    const uint8_t names[] = {64, 0, 1, 63, 65, 255, 128, 2, 3, 4, 5, 6};
    const struct {
        uint8_t stored;
        uint32_t copied;
    } rows[] = {{0, 0}, {1, 1}, {2, 2}, {11, 11}, {12, 12}, {13, 12}, {128, 12}, {255, 12}};
    for (const auto& row : rows) {
        SCOPED_TRACE(+row.stored);
        fake::reset();
        uint8_t* const area = patterned_area(kInstances, 940);
        area[0] = row.stored;
        Bytes expected(1 + 67 * row.copied, 0xA5);
        expected[0] = static_cast<uint8_t>(row.copied);
        for (uint32_t i = 0; i < 12; ++i)
            area[4 + 76 * i + 9] = names[i];
        for (uint32_t i = 0; i < row.copied; ++i) {
            const uint8_t* const entry = area + 4 + 76 * i;
            const uint8_t length = std::min<uint8_t>(names[i], 64);
            uint8_t* const out = &expected[1 + 67 * i];
            out[0] = entry[8];
            out[1] = length;
            std::memcpy(out + 2, entry + 10, length);
            out[66] = entry[74];
        }
        uint8_t* const list = fake::guarded(static_cast<uint32_t>(expected.size()));
        EXPECT_EQ(BT_SRV_MAP_getMasServiceInfo(reinterpret_cast<BtMapInstanceList*>(list)), 0);
        EXPECT_EQ(fake::to_hex(Bytes(list, list + expected.size())), fake::to_hex(expected));
        EXPECT_THAT(fake::sizes_asked(), ElementsAre(940u));
    }
    shm_unlink(kObject);
}

TEST(MessageAccessResults, InstancesNeedTheirAreaButNotTheObject)
{
    fake::reset();
    auto* const memory = fake::guarded(sizeof(BtMapInstanceList));
    auto* const list = reinterpret_cast<BtMapInstanceList*>(memory);
    expect_untouched_without_area(kInstances, 940, memory, sizeof *list,
                                  [&] { return BT_SRV_MAP_getMasServiceInfo(list); });
    fake::area(kInstances, 940, 0);
    EXPECT_EQ(BT_SRV_MAP_getMasServiceInfo(nullptr), -1);

    const int next = dup(0);
    close(next);
    int object = -1;
    for (int i = 0; object < 0 && i < 100; ++i) { // another run of this test may remove it in between
        shm_unlink(kObject);
        EXPECT_EQ(BT_SRV_MAP_getMasServiceInfo(list), 0);
        object = shm_open(kObject, O_RDWR, 0);
    }
    EXPECT_EQ(object, next) << "created, and no descriptor is left open";
    const mode_t mask = umask(0);
    umask(mask);
    struct stat status = {};
    fstat(object, &status);
    EXPECT_EQ(status.st_mode & 0777u, 0777u & ~mask);
    close(object);
    shm_unlink(kObject);

    EXPECT_TRUE(fake::in_child([&] { // where no descriptor can be had
        const rlimit none = {0, 0};
        ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &none), 0);
        memory[0] = 0xA5;
        EXPECT_EQ(BT_SRV_MAP_getMasServiceInfo(list), 0);
        EXPECT_EQ(memory[0], 0);
    }));
}

} // namespace
