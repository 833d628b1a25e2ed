// What the services leave in shared areas without a lock, and the message that an application leaves there.
#include "request_rows.h"

#include <bt_service/bt_audio_video.h>
#include <bt_service/bt_message_access.h>
#include <bt_service/bt_system.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

namespace {

using fake::Bytes;
using requests::without_heap_or_log;
using SharedResults = requests::RequestRows;

uint8_t* patterned_area(const char* name, uint32_t size)
{
    uint8_t* const area = fake::area(name, size);
    for (size_t i = 0; i < size; ++i)
        area[i] = static_cast<uint8_t>(i * 7 + i / 251 + 1);
    return area;
}

void put_word(uint8_t* at, uint32_t value)
{
    std::memcpy(at, &value, sizeof value);
}

template <class T>
T* guarded_record()
{
    return static_cast<T*>(static_cast<void*>(fake::guarded(sizeof(T))));
}

// Each way in which an area is not there, or is shorter than `needed`; nothing may be written then.
void expect_untouched_without_area(const char* area, uint32_t size, uint32_t asked, uint32_t needed, int32_t result,
                                   const std::function<int32_t(uint8_t*)>& read)
{
    SCOPED_TRACE(area);
    fake::reset();
    uint8_t* const out = fake::guarded(20000);
    const auto call = [&] { return without_heap_or_log([&] { return read(out); }); };
    EXPECT_EQ(call(), result) << "not shared";
    fake::null_area(area);
    EXPECT_EQ(call(), result) << "no address";
    patterned_area(area, size);
    fake::fail_only("LinkShareData");
    EXPECT_EQ(call(), result) << "link fails";
    fake::fail_only("");
    fake::report_size(area, needed - 1);
    EXPECT_EQ(call(), result) << "too small";
    EXPECT_EQ(Bytes(out, out + 20000), Bytes(20000, 0xA5));
    EXPECT_EQ(fake::sizes_asked(), std::vector<uint32_t>(4, asked)) << "linked by every call";
}

// ---- lists: a head with the count, and entries; a message is a list of the bytes of its body

// Leaves a reader's outputs in `out`, one after the other, each of which has memory of its own while it is called.
using Read = std::function<int32_t(uint32_t start, uint32_t count, uint8_t* out)>;
constexpr uint32_t kAll = 0xAAAAAAAA; // instead of a count: the reader that has no maximum

Read audio_video_list(int32_t (*read)(uint32_t, uint32_t, list_result*))
{
    return [=](uint32_t start, uint32_t count, uint8_t* out) {
        list_result* const result = guarded_record<list_result>();
        result->entries = out + 8;
        const int32_t answer = without_heap_or_log([&] { return read(start, count, result); });
        EXPECT_EQ(result->entries, out + 8);
        std::memcpy(out, result, 8);
        return answer;
    };
}

Read message_access_list(int32_t (*read)(uint32_t*, void*), int32_t (*read_some)(uint32_t, uint32_t*, void*))
{
    return [=](uint32_t, uint32_t maximum, uint8_t* out) {
        uint32_t* const count = guarded_record<uint32_t>();
        const auto call = [&] { return maximum == kAll ? read(count, out + 4) : read_some(maximum, count, out + 4); };
        const int32_t answer = without_heap_or_log(call);
        std::memcpy(out, count, 4);
        return answer;
    };
}

int32_t read_message(uint32_t, uint32_t maximum, uint8_t* out)
{
    static_assert(offsetof(message_record, body) == (sizeof(void*) == 8 ? 8168 : 8164));
    message_record* const record = guarded_record<message_record>();
    record->body = out + 8164;
    const int32_t answer = without_heap_or_log([&] {
        return maximum == kAll ? BT_SRV_MAP_getMessageData(record) : BT_SRV_MAP_getMessageData_ex(maximum, record);
    });
    EXPECT_EQ(record->body, out + 8164) << "the caller's own";
    std::memcpy(out, record, 8164);
    return answer;
}

struct List {
    const char* area;
    uint32_t size, asked;
    uint32_t head_at, head_size, count_at; // count_at in the head
    uint32_t entries_at, entry_size;
    Read read;
};
const List kMessage = {"/tmp/shm_map_getmsg", 73713, 73713, 4, 8164, 8156, 8172, 1, read_message};
const List kAudioVideoLists[] = {
    {"/tmp/shm_avp_medialst", 28812, 0, 0, 8, 4, 12, 288, audio_video_list(BT_SRV_AVP_getMediaListData)},
    {"/tmp/shm_avp_playerlst", 30012, 0, 0, 8, 4, 12, 300, audio_video_list(BT_SRV_AVP_getPlayerListData)}};
const List kMessageAccessLists[] = {
    {"/tmp/shm_map_msglst", 247216, 247216, 0, 4, 0, 16, 1648,
     message_access_list(BT_SRV_MAP_getMessageListData, BT_SRV_MAP_getMessageListData_ex)},
    {"/tmp/shm_map_fldlst", 26004, 26004, 0, 4, 0, 4, 260,
     message_access_list(BT_SRV_MAP_getFolderListData, BT_SRV_MAP_getFolderListData_ex)}};

struct Case {
    uint32_t stored, start, count;
    int32_t result;
    uint32_t copied;
    uint32_t size = 0, reported = kAll; // where they are not the usual ones
};

void run(const List& list, const std::vector<Case>& cases)
{
    for (const Case& row : cases) {
        SCOPED_TRACE(testing::Message() << list.area << " " << row.stored << " from " << row.start << " count "
                                        << row.count << " in " << row.size << "/" << row.reported);
        fake::reset();
        uint8_t* const area = patterned_area(list.area, row.size == 0 ? list.size : row.size);
        if (row.reported != kAll) fake::report_size(list.area, row.reported);
        put_word(area + list.head_at + list.count_at, row.stored);
        const uint32_t length = row.copied * list.entry_size;
        uint8_t* const out = fake::guarded(list.head_size + length);
        EXPECT_EQ(list.read(row.start, row.count, out), row.result);

        Bytes expected(area + list.head_at, area + list.head_at + list.head_size);
        put_word(&expected[list.count_at], row.copied);
        const uint8_t* const entries = area + list.entries_at + (row.copied == 0 ? 0 : row.start * list.entry_size);
        expected.insert(expected.end(), entries, entries + length);
        if (row.result != 0) expected.assign(list.head_size, 0xA5);
        EXPECT_TRUE(Bytes(out, out + list.head_size + length) == expected);
        EXPECT_EQ(fake::sizes_asked(), std::vector<uint32_t>(row.result == 0, list.asked));
    }
}

TEST_F(SharedResults, ListsOfAudioAndVideoAreCopiedAsFarAsTheyGo)
{
    const std::vector<Case> cases = {{5, 0, 5, 0, 5},       {5, 0, 4, 0, 4},      {5, 3, 10, 0, 2},
                                     {5, 5, 10, 0, 0},      {5, 6, 10, 0, 0},     {5, 100, 0, 0, 0},
                                     {0, 0, 100, 0, 0},     {100, 90, 10, 0, 10}, {100, 0, 100, 0, 100},
                                     {100, 90, 11, -1, 0},  {100, 0, 101, -1, 0}, {100, 101, 0, -1, 0},
                                     {101, 0, 100, 0, 100}, {101, 100, 0, 0, 0},  {~0u, 99, 1, 0, 1},
                                     {5, 1, ~0u, -1, 0},    {5, ~0u, 1, -1, 0},   {5, 1u << 31, 1u << 31, -1, 0}};
    for (const List& list : kAudioVideoLists) {
        run(list, cases);
        for (const uint32_t more : {0u, 2 * list.entry_size, 3 * list.entry_size - 1}) // areas that end early
            run(list, {{~0u, 0, 100, 0, more == 0 ? 0u : 2u, 12 + more}});
        run(list, {{5, 3, 10, 0, 2, list.size, 0}}); // an area whose size is not told
        const auto read = [&](uint8_t* out) { return list.read(0, 10, out); };
        expect_untouched_without_area(list.area, list.size, 0, 12, 0, read);
    }
    REFUSES(-1, BT_SRV_AVP_getMediaListData, 0, 5, nullptr);
    REFUSES(-1, BT_SRV_AVP_getPlayerListData, 0, 5, nullptr);
    put_word(patterned_area(kAudioVideoLists[0].area, 28812) + 4, 5);
    list_result no_room = {1, 2, nullptr};
    EXPECT_EQ(BT_SRV_AVP_getMediaListData(4, 5, &no_room), -1);
    EXPECT_EQ(no_room.count, 2u);
    EXPECT_EQ(BT_SRV_AVP_getMediaListData(5, 5, &no_room), 0) << "nothing to copy";
    EXPECT_EQ(no_room.count, 0u);
}

TEST_F(SharedResults, ListsOfMessageAccessAreCopiedAsFarAsTheyGo)
{
    for (const List& list : kMessageAccessLists) {
        const uint32_t full = list.entry_size == 1648 ? 150 : 100, more = full + 1;
        const std::vector<Case> cases = {{0, 0, kAll, 0, 0},       {3, 0, kAll, 0, 3},      {full, 0, kAll, 0, full},
                                         {more, 0, kAll, 0, full}, {~0u, 0, kAll, 0, full}, {0, 0, 10, 0, 0},
                                         {3, 0, 10, 0, 3},         {full, 0, 10, 0, 10},    {more, 0, more, 0, full},
                                         {~0u, 0, ~0u, 0, full},   {~0u, 0, 1, 0, 1},       {3, 0, 0, -1, 0}};
        run(list, cases);
        // Areas that are too long, without a size, and reported smaller than asked.
        const uint32_t two_and_a_part = list.entries_at + 3 * list.entry_size - 1;
        run(list, {{~0u, 0, kAll, 0, full, list.size + list.entry_size},
                   {~0u, 0, kAll, 0, full, list.size, 0},
                   {~0u, 0, kAll, 0, 2, list.size, two_and_a_part}});
        for (const uint32_t maximum : {kAll, 1u})
            expect_untouched_without_area(list.area, list.size, list.size, list.entries_at, -1,
                                          [&](uint8_t* out) { return list.read(0, maximum, out); });
    }
    REFUSES(-1, BT_SRV_MAP_getMessageListData, nullptr, "00*1648");
    REFUSES(-1, BT_SRV_MAP_getMessageListData_ex, 1, "00*4", nullptr);
    REFUSES(-1, BT_SRV_MAP_getFolderListData, "00*4", nullptr);
    REFUSES(-1, BT_SRV_MAP_getFolderListData_ex, 1, nullptr, "00*260");
}

TEST_F(SharedResults, MessageIsCopiedWithItsBody)
{
    const uint32_t usual = 73713;
    const std::vector<Case> cases = {{0, 0, kAll, 0, 0},         {500, 0, kAll, 0, 500},   {65541, 0, kAll, 0, 65541},
                                     {65542, 0, kAll, 0, 65541}, {~0u, 0, kAll, 0, 65541}, {500, 0, 100, 0, 100},
                                     {100, 0, 500, 0, 100},      {0, 0, 1, 0, 0},          {65542, 0, 65542, 0, 65541},
                                     {~0u, 0, ~0u, 0, 65541},    {1, 0, 0, -1, 0}};
    run(kMessage, cases);
    // A larger area; one without a size, for which the size it asked for counts; those reported smaller than asked.
    const std::vector<Case> sizes = {{~0u, 0, kAll, 0, 71828, 80000, kAll},
                                     {70000, 0, 71000, 0, 70000, 80000, kAll},
                                     {~0u, 0, kAll, 0, 65541, usual, 0},
                                     {500, 0, kAll, 0, 1, usual, 8173},
                                     {500, 0, 500, 0, 0, usual, 8172}};
    run(kMessage, sizes);
    for (const uint32_t maximum : {kAll, 5u})
        expect_untouched_without_area(kMessage.area, usual, usual, 8172, -1,
                                      [=](uint8_t* out) { return read_message(0, maximum, out); });
    REFUSES(-1, BT_SRV_MAP_getMessageData, nullptr);
    REFUSES(-1, BT_SRV_MAP_getMessageData_ex, 5, nullptr);

    uint8_t* const area = patterned_area(kMessage.area, usual);
    message_record no_room{};
    put_word(area + 8160, 1);
    EXPECT_EQ(BT_SRV_MAP_getMessageData(&no_room), -1);
    EXPECT_EQ(no_room.header[0], 0u);
    put_word(area + 8160, 0);
    EXPECT_EQ(BT_SRV_MAP_getMessageData(&no_room), 0) << "no body";
    EXPECT_EQ(std::memcmp(&no_room, area + 4, 8156), 0);
}

// ---- records

TEST_F(SharedResults, RecordsAreCopiedFromWhereTheyAreNow)
{
    const char* const device = "/tmp/shm_sysmgr_local_devinfo";
    const struct {
        const char* area;
        uint32_t size, asked, offset, length;
        std::function<int32_t(void*)> read;
    } records[] = {
        {"/tmp/shm_avp_media", 1060, 0, 0, 1060, BT_SRV_AVP_getMediaData},
        {device, 348, 348, 0, 348,
         [](void* out) { return BT_SRV_getLocalDeviceInformation(static_cast<BtSysLocalDevice*>(out)); }},
        {device, 348, 348, 340, 8, [](void* out) { return BT_SRV_getLocalDeviceDIDInfo(static_cast<BtSysDid*>(out)); }},
    };
    for (const auto& record : records) {
        expect_untouched_without_area(record.area, record.size, record.asked, record.size, -1, record.read);
        const uint8_t* const at = patterned_area(record.area, record.size) + record.offset;
        EXPECT_EQ(requests::output_of(record.length, record.read, 0), Bytes(at, at + record.length));
        fake::report_size(record.area, 0); // not told
        EXPECT_EQ(requests::output_of(record.length, record.read, 0), Bytes(at, at + record.length));
        const size_t calls = fake::calls().size();
        EXPECT_EQ(record.read(nullptr), -1);
        EXPECT_EQ(fake::calls().size(), calls);
    }
}

TEST_F(SharedResults, ProfileStatesAreThoseOfTheFirstEightWords)
{
    EXPECT_THAT(g_setup_state, testing::Each(0u));
    const uint32_t states[9] = {10, 11, 12, 13, 14, 15, 16, 0xFFFFFFFF, 18};
    std::copy(std::begin(states), std::end(states), g_setup_state);
    for (uint32_t index = 0; index < 8; ++index)
        EXPECT_EQ(BT_SRV_getEffectiveProfileState(index), static_cast<int32_t>(states[index]));
    for (const uint32_t index : {8u, 9u, 0x100u, 0x40000000u, UINT32_MAX})
        EXPECT_EQ(BT_SRV_getEffectiveProfileState(index), 2) << index;
    std::fill(std::begin(g_setup_state), std::end(g_setup_state), 0u);
}

// ---- the message to push

push_record pushed(const uint8_t* body, uint32_t length)
{
    push_record record;
    std::memcpy(&record, patterned_area("the record", sizeof record), sizeof record);
    record.body = body;
    record.body_length = length;
    return record;
}

TEST_F(SharedResults, PushFillsTheAreaButForTheUnusedGroups)
{
    const char* const name = "/tmp/shm_map_pushmsg";
    const struct {
        uint32_t size, reported, length, stored;
    } rows[] = {{9652, 9652, 0, 0},   {9652, 9652, 1500, 1500},   {9652, 9652, 1501, 1500}, {9652, 9652, ~0u, 1500},
                {9652, 0, ~0u, 1500}, {12000, 12000, 5000, 3848}, {9652, 8153, 12, 1},      {9652, 8152, 12, 0}};
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::Message() << row.size << "/" << row.reported << " body " << row.length);
        fake::reset();
        uint8_t* const area = fake::area(name, row.size, 0xDD);
        fake::report_size(name, row.reported);
        const push_record record = pushed(fake::guarded(row.stored, 0xB0), row.length);
        Bytes expected(row.size, 0xDD);
        std::memcpy(&expected[0], &record, 2628);
        std::memcpy(&expected[7876], reinterpret_cast<const uint8_t*>(&record) + 7876, 272);
        put_word(&expected[8140], row.stored);
        put_word(&expected[8148], static_cast<uint32_t>(reinterpret_cast<uintptr_t>(area) + 8152));
        std::fill_n(expected.begin() + 8152, row.stored, uint8_t{0xB0});
        EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(nullptr, 1)), -1);
        EXPECT_EQ(without_heap_or_log([&] { return BT_SRV_MAP_setPushMessageData(record); }), 0);
        EXPECT_TRUE(Bytes(area, area + row.size) == expected);
        EXPECT_THAT(fake::sizes_asked(), testing::ElementsAre(9652u));
        EXPECT_EQ(BT_SRV_MAP_setPushMessageData(pushed(nullptr, 0)), 0);
    }
    fake::reset();
    const push_record record = pushed(nullptr, 0);
    expect_untouched_without_area(name, 9652, 9652, 8152, -1,
                                  [=](uint8_t*) { return BT_SRV_MAP_setPushMessageData(record); });
    EXPECT_EQ(fake::find_area(name)[8148], 0xed) << "the area's own pattern";
}

// ---- server instances

int32_t read_instances(uint8_t* out)
{
    return BT_SRV_MAP_getMasServiceInfo(reinterpret_cast<BtMapInstanceList*>(out));
}

TEST_F(SharedResults, InstancesAreCopiedWithTheirNames)
{
    const char* const name = "/tmp/shm_map_insinfo";
    const uint8_t lengths[] = {64, 0, 1, 63, 65, 255, 128, 2, 3, 4, 5, 6};
    const struct {
        uint8_t stored, copied;
        uint32_t reported;
    } rows[] = {{0, 0, 940}, {1, 1, 940}, {12, 12, 940}, {13, 12, 940}, {255, 12, 0}, {12, 11, 915}};
    for (const auto& [stored, copied, reported] : rows) {
        SCOPED_TRACE(testing::Message() << +stored << " in " << reported);
        fake::reset();
        uint8_t* const area = patterned_area(name, 940);
        fake::report_size(name, reported);
        area[0] = stored;
        Bytes expected(1, copied);
        expected.resize(1u + 67u * expected[0], 0xA5);
        for (size_t i = 0; i < 12; ++i)
            area[4 + 76 * i + 9] = lengths[i];
        for (size_t i = 0; i < expected[0]; ++i) {
            const uint8_t* const entry = area + 4 + 76 * i;
            uint8_t* const instance = &expected[1 + 67 * i];
            instance[0] = entry[8];
            instance[1] = std::min<uint8_t>(lengths[i], 64);
            std::memcpy(instance + 2, entry + 10, instance[1]);
            instance[66] = entry[74];
        }
        uint8_t* const out = fake::guarded(static_cast<uint32_t>(expected.size()));
        EXPECT_EQ(without_heap_or_log([&] { return read_instances(out); }), 0);
        EXPECT_TRUE(Bytes(out, out + expected.size()) == expected);
    }
    expect_untouched_without_area(name, 940, 940, 4, -1, read_instances);
    REFUSES(-1, BT_SRV_MAP_getMasServiceInfo, nullptr);
    shm_unlink("BT_SRV_MAP_SERVICE_INFO");
}

using SharedResultsDeathTest = SharedResults;

TEST_F(SharedResultsDeathTest, InstancesMakeAnObjectButDoNotNeedIt)
{
    const char* const name = "BT_SRV_MAP_SERVICE_INFO";
    fake::reset();
    fake::area("/tmp/shm_map_insinfo", 940, 0);
    uint8_t* const list = fake::guarded(1);
    const int next = dup(0);
    close(next);
    int object = -1;
    for (int i = 0; object < 0 && i < 100; ++i) { // another run of this test may remove it in between
        shm_unlink(name);
        EXPECT_EQ(read_instances(list), 0);
        object = shm_open(name, O_RDWR, 0);
    }
    EXPECT_EQ(object, next) << "created, and no descriptor is left open";
    const mode_t mask = umask(0);
    umask(mask);
    struct stat status = {};
    fstat(object, &status);
    EXPECT_EQ(status.st_mode & 0777u, 0777u & ~mask);
    close(object);
    shm_unlink(name);

    EXPECT_TRUE(fake::in_child([&] {
        const rlimit no_descriptor = {0, 0};
        ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &no_descriptor), 0);
        list[0] = 0xA5;
        EXPECT_EQ(read_instances(list), 0);
        EXPECT_EQ(list[0], 0);
    }));
}

} // namespace
