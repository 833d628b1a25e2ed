// What the audio/video service leaves in shared memory: media list, player list and media data.
#include "fake_platform.h"

#include <bt_service/bt_audio_video.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>

namespace {

using fake::Bytes;

struct List {
    const char* name;
    uint32_t entry_size, area_size;
    int32_t (*read)(uint32_t, uint32_t, list_result*);

    Bytes entry(uint32_t index) const // no two alike
    {
        Bytes bytes(entry_size);
        for (uint32_t i = 0; i < entry_size; ++i)
            bytes[i] = static_cast<uint8_t>(index + 3 * i + 1);
        return bytes;
    }

    void share(uint32_t stored) const
    {
        uint8_t* const at = fake::area(name, area_size);
        const uint32_t words[] = {0x11223344, stored, 0x55667788};
        std::memcpy(at, words, sizeof words);
        for (uint32_t i = 0; i < 100; ++i)
            std::memcpy(at + 12 + i * entry_size, entry(i).data(), entry_size);
    }

    Bytes entries(uint32_t start, uint32_t count) const
    {
        Bytes all;
        for (uint32_t i = 0; i < count; ++i) {
            const Bytes one = entry(start + i);
            all.insert(all.end(), one.begin(), one.end());
        }
        return all;
    }
};

const List kLists[] = {{"/tmp/shm_avp_medialst", 288, 28812, BT_SRV_AVP_getMediaListData},
                       {"/tmp/shm_avp_playerlst", 300, 30012, BT_SRV_AVP_getPlayerListData}};

// A result record at the end of readable memory, with room for exactly `count` entries.
struct Result {
    Result(const List& list, uint32_t count) : size(count * list.entry_size), entries(fake::guarded(size))
    {
        record = reinterpret_cast<list_result*>(fake::guarded(sizeof *record));
        record->entries = entries;
        untouched = bytes();
    }
    Bytes bytes() const
    {
        const auto* const at = reinterpret_cast<const uint8_t*>(record);
        Bytes all(at, at + sizeof *record);
        all.insert(all.end(), entries, entries + size);
        return all;
    }

    uint32_t size;
    uint8_t* entries;
    list_result* record = nullptr;
    Bytes untouched;
};

TEST(AudioVideoResults, ListsAreCopiedAsFarAsTheyGo)
{
    const struct {
        uint32_t stored, start, count;
        int32_t result;
        uint32_t copied;
    } rows[] = {
        {5, 0, 5, 0, 5},
        {5, 0, 4, 0, 4},
        {5, 3, 10, 0, 2},
        {5, 4, 1, 0, 1},
        {5, 5, 10, 0, 0},
        {5, 6, 10, 0, 0}, // starts behind the end
        {5, 100, 0, 0, 0},
        {5, 2, 0, 0, 0},
        {0, 0, 100, 0, 0},
        {0, 0, 0, 0, 0},
        {100, 90, 10, 0, 10},
        {100, 0, 100, 0, 100},
        {100, 90, 11, -1, 0},
        {100, 0, 101, -1, 0},
        {100, 101, 0, -1, 0},
        {5, 1, 0xFFFFFFFF, -1, 0}, // sums that would wrap around
        {5, 0xFFFFFFFF, 1, -1, 0},
        {5, 0x80000000, 0x80000000, -1, 0},
        {5, 0xFFFFFFFF, 0xFFFFFFFF, -1, 0},
        {101, 0, 100, 0, 100}, // impossible numbers count as 100
        {101, 100, 0, 0, 0},
        {0x10005, 3, 97, 0, 97},
        {0x80000000, 99, 1, 0, 1},
        {0xFFFFFFFF, 0, 100, 0, 100},
    };
    for (const List& list : kLists)
        for (const auto& row : rows) {
            SCOPED_TRACE(testing::Message()
                         << list.name << " " << row.stored << " from " << row.start << " count " << row.count);
            fake::reset();
            list.share(row.stored);
            const Result result(list, row.copied);
            ASSERT_EQ(list.read(row.start, row.count, result.record), row.result);
            if (row.result != 0) {
                EXPECT_EQ(result.bytes(), result.untouched);
                EXPECT_TRUE(fake::calls().empty());
                continue;
            }
            EXPECT_EQ(result.record->header, 0x11223344u);
            EXPECT_EQ(result.record->count, row.copied);
            EXPECT_EQ(result.record->entries, static_cast<void*>(result.entries));
            EXPECT_EQ(Bytes(result.entries, result.entries + result.size), list.entries(row.start, row.copied));
            EXPECT_THAT(fake::calls(), testing::ElementsAre("LinkShareData(" + std::string(list.name) + ")"));
            EXPECT_THAT(fake::sizes_asked(), testing::ElementsAre(0u));
        }
}

TEST(AudioVideoResults, ListsAreNotReadBehindAShorterArea)
{
    for (const List& list : kLists)
        for (const uint32_t size : {4u, 12u, 12 + 2 * list.entry_size, 11 + 3 * list.entry_size}) {
            fake::reset();
            uint8_t* const area = fake::area(list.name, size, 0xFF);
            const Result result(list, 2);
            result.record->count = 0;
            EXPECT_EQ(list.read(0, 100, result.record), 0);
            EXPECT_EQ(result.record->count, size < 100 ? 0u : 2u);
            EXPECT_EQ(std::memcmp(result.entries, area + std::min(12u, size), result.record->count * list.entry_size),
                      0);
        }
}

TEST(AudioVideoResults, ListsThatAreNotSharedLeaveTheResultAsItWas)
{
    for (const List& list : kLists) {
        fake::reset();
        const Result result(list, 10);
        EXPECT_EQ(list.read(0, 10, result.record), 0);
        fake::null_area(list.name);
        EXPECT_EQ(list.read(0, 10, result.record), 0);
        list.share(10);
        fake::fail_only("LinkShareData");
        EXPECT_EQ(list.read(0, 10, result.record), 0);
        EXPECT_EQ(result.bytes(), result.untouched);

        fake::fail_only("");
        EXPECT_EQ(list.read(0, 10, result.record), 0);
        EXPECT_EQ(result.record->count, 10u);
        EXPECT_EQ(fake::calls().size(), 4u) << "linked by every call";
    }
}

TEST(AudioVideoResults, ListsRefuseNulls)
{
    for (const List& list : kLists) {
        fake::reset();
        list.share(5);
        Result result(list, 0);
        result.record->entries = nullptr;
        result.untouched = result.bytes();
        EXPECT_EQ(list.read(0, 5, nullptr), -1);
        EXPECT_EQ(list.read(4, 5, result.record), -1);
        EXPECT_EQ(result.bytes(), result.untouched);
        EXPECT_EQ(list.read(5, 5, result.record), 0) << "nothing to copy";
        EXPECT_EQ(result.record->header, 0x11223344u);
        EXPECT_EQ(result.record->count, 0u);
    }
}

TEST(AudioVideoResults, MediaDataIsCopiedWhole)
{
    const char* const name = "/tmp/shm_avp_media";
    fake::reset();
    uint8_t* const data = fake::guarded(1060);
    const Bytes untouched(1060, 0xA5);
    EXPECT_EQ(BT_SRV_AVP_getMediaData(data), -1) << "not shared";
    fake::null_area(name);
    EXPECT_EQ(BT_SRV_AVP_getMediaData(data), -1);
    uint8_t* const area = fake::area(name, 1060);
    for (size_t i = 0; i < 1060; ++i)
        area[i] = static_cast<uint8_t>(i + i / 256);
    fake::fail_only("LinkShareData");
    EXPECT_EQ(BT_SRV_AVP_getMediaData(data), -1);
    fake::fail_only("");
    EXPECT_EQ(BT_SRV_AVP_getMediaData(nullptr), -1);
    EXPECT_EQ(Bytes(data, data + 1060), untouched);

    EXPECT_EQ(BT_SRV_AVP_getMediaData(data), 0);
    EXPECT_EQ(Bytes(data, data + 1060), Bytes(area, area + 1060));
    EXPECT_THAT(fake::sizes_asked(), testing::Each(0u));
}

} // namespace
