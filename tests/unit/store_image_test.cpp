// The image file that mirrors the persistent part of the area.
#include "store_support.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>

using namespace store;

namespace {

// Expects these persistent bytes, nothing else of the area touched, and this image file.
void expect_left(const Bytes& data, const Bytes& file)
{
    EXPECT_EQ(difference(area_bytes(), data + Bytes(kAreaSize - kPersistentSize, 0x5A)), "");
    EXPECT_EQ(difference(*fake::read_file(kImagePath), file), "");
}

} // namespace

TEST(StoreImage, DefaultsAndChecksum)
{
    static_assert(sizeof g_con_data_from_init == kPersistentSize);
    const auto* const exported = reinterpret_cast<const uint8_t*>(&g_con_data_from_init);
    EXPECT_EQ(difference(Bytes(exported, exported + kPersistentSize), default_data()), "");
    EXPECT_EQ(bt_con_calcSum(exported, 19148), 286569u);

    const Bytes high(19148, 0xFF);
    EXPECT_EQ(bt_con_calcSum(high.data(), 19148), 19148u * 255u);
    for (const int32_t length : {0, -1, INT32_MIN})
        EXPECT_EQ(bt_con_calcSum(high.data(), length), 0u);
    EXPECT_EQ(bt_con_calcSum(nullptr, 5), 0u);
}

TEST(StoreImage, LoadTakesAWholeImageAndNothingElse)
{
    const Bytes good = image_of(sample_data());
    const auto with = [&](size_t at, int change) {
        Bytes image = good;
        image[at] = static_cast<uint8_t>(image[at] + change);
        return image;
    };
    const struct {
        const char* what;
        Bytes file;
        bool loads;
    } rows[] = {
        {"whole", good, true},
        {"trailing bytes", good + Bytes(9, 0x11), true},
        {"reserved bytes set", with(6, 1), true},
        {"19,159 bytes", Bytes(good.begin(), good.end() - 1), false},
        {"first byte of the magic", with(0, 1), false},
        {"byte 4 of the magic", with(4, 1), false},
        {"checksum too high", with(8, 1), false},
        {"top byte of the checksum", with(11, 1), false},
        {"first data byte", with(12, 1), false},
        {"last data byte", with(19159, 1), false},
        {"reset asked for", image_of(sample_data(), 1), false},
        {"reset asked for with another value", image_of(sample_data(), 0xFF), false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        attached_process(Bytes(kPersistentSize, 0x42));
        fake::write_file(kImagePath, row.file);
        EXPECT_EQ(bt_con_readFROM(), 0);
        expect_left(row.loads ? sample_data() : default_data(), row.loads ? row.file : image_of(default_data()));
        EXPECT_EQ(fake::counted_calls(), row.loads ? 4u : 2u); // attaching makes two
    }
    const Bytes old(kPersistentSize, 0x42);
    for (const uint32_t n : {1u, 2u}) {
        attached_process(old);
        fake::write_file(kImagePath, good);
        fake::fail_nth(n);
        EXPECT_EQ(bt_con_readFROM(), n == 1 ? fake::kLockFailure : fake::kUnlockFailure);
        expect_left(n == 1 ? old : sample_data(), good);
        EXPECT_EQ(fake::held_locks(), 0u);
    }
}

TEST(StoreImage, FileThatCannotBeUsedLeavesTheDefaultsInTheArea)
{
    const std::string path = fake::root() + kImagePath;
    const std::function<void()> files[] = {
        [] {}, // none
        [&] { ASSERT_EQ(mkfifo(path.c_str(), 0600), 0); }, // readable, but it cannot seek
    };
    for (const auto& make : files) {
        attached_process(sample_data());
        fake::remove_file(kImagePath);
        make();
        const int pipe = open(path.c_str(), O_RDWR);
        const Bytes image = image_of(sample_data());
        if (pipe >= 0) {
            ASSERT_EQ(write(pipe, image.data(), image.size()), static_cast<ssize_t>(image.size()));
        }
        for (int32_t (*const operation)() : {bt_con_writeFROM, bt_con_readFROM, bt_con_initFROM})
            EXPECT_EQ(operation(), -1);
        EXPECT_EQ(difference(area_bytes(0, kPersistentSize), default_data()), "");
        close(pipe);
    }
    fake::remove_file(kImagePath);
    fresh_process(); // not attached
    for (int32_t (*const operation)() : {bt_con_writeFROM, bt_con_readFROM, bt_con_initFROM})
        EXPECT_EQ(operation(), -1);
    expect_left(default_data(), stale_image());
}

TEST(StoreImage, WriteRewritesTheFileInPlace)
{
    const Bytes image = image_of(sample_data());
    attached_process(sample_data());
    for (const size_t longer : {3u, 0u}) {
        fake::write_file(kImagePath, Bytes(longer == 0 ? 0 : kImageSize + longer, 0x77));
        EXPECT_EQ(bt_con_writeFROM(), 0);
        expect_left(sample_data(), image + Bytes(longer, 0x77));
    }
    fake::with_longest_file(kImageSize - 1, [] { EXPECT_EQ(bt_con_writeFROM(), -1); });

    EXPECT_EQ(bt_con_initFROM(), 0);
    expect_left(default_data(), image_of(default_data()));
    EXPECT_EQ(fake::counted_calls(), 2u) << "no lock";
}

TEST(StoreImage, StartUpStatusDecidesWhetherTheDefaultsReplaceTheImage)
{
    const Bytes image = image_of(sample_data()), defaults = image_of(default_data()), old(kPersistentSize, 0x42);
    const struct {
        int32_t status, result;
        Bytes data, file;
        bool attaches;
    } rows[] = {{0, 1, default_data(), defaults, true},
                {1, 0, sample_data(), image, true},
                {2, 1, default_data(), defaults, true},
                {3, 1, old, image, false},
                {4, -1, old, image, false},
                {-1, -1, old, image, false}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.status);
        fresh_process(old);
        fake::write_file(kImagePath, image);
        EXPECT_EQ(bt_con_checkBackUpData(row.status), row.result);
        expect_left(row.data, row.file);
        EXPECT_EQ(g_bt_con_share.area != nullptr, row.attaches);

        fresh_process(old); // what the calls made answer is not reported
        fake::fail_from(1);
        EXPECT_EQ(bt_con_checkBackUpData(row.status), row.result);
        expect_left(old, stale_image());
    }
}
