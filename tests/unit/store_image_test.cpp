#include "store_support.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>

using namespace store;

namespace {

Bytes sample_data()
{
    return device_list("PQR") + order_list("QP") + profile_orders(7, "RPQ") + id_list(id_entry('R', 9, 2));
}

Bytes persistent()
{
    return area_bytes(0, kPersistentSize);
}

void expect_rest_untouched()
{
    const size_t rest = kAreaSize - kPersistentSize;
    EXPECT_EQ(area_bytes(kPersistentSize, rest), Bytes(rest, 0x5A));
}

} // namespace

TEST(StoreImage, DefaultsAreWhatEmptyListsLookLike)
{
    Bytes exported(kPersistentSize);
    ASSERT_EQ(sizeof g_con_data_from_init, kPersistentSize);
    std::memcpy(exported.data(), &g_con_data_from_init, kPersistentSize);
    EXPECT_EQ(difference(exported, default_data()), "");
    EXPECT_EQ(bt_con_calcSum(exported.data(), 19148), 286569u);
}

TEST(StoreImage, ChecksumAddsUnsignedBytes)
{
    const Bytes high(19148, 0xFF);
    EXPECT_EQ(bt_con_calcSum(high.data(), 19148), 19148u * 255u);
    EXPECT_EQ(bt_con_calcSum(high.data(), 1), 255u);
    for (const int32_t length : {0, -1, INT32_MIN})
        EXPECT_EQ(bt_con_calcSum(high.data(), length), 0u);
    EXPECT_EQ(bt_con_calcSum(nullptr, 5), 0u);
}

TEST(StoreImage, LoadTakesAWholeImageAndNothingElse)
{
    const Bytes good = image_of(sample_data()), defaults = image_of(default_data());
    const auto with = [&](size_t at, uint8_t byte) {
        Bytes image = good;
        image[at] = byte;
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
        {"empty", {}, false},
        {"first byte of the magic", with(0, 'b'), false},
        {"byte 4 of the magic", with(4, 1), false},
        {"checksum too high", with(8, static_cast<uint8_t>(good[8] + 1)), false},
        {"top byte of the checksum", with(11, 1), false},
        {"first data byte", with(12, static_cast<uint8_t>(good[12] + 1)), false},
        {"last data byte", with(19159, static_cast<uint8_t>(good[19159] + 1)), false},
        {"reset asked for", image_of(sample_data(), 1), false},
        {"reset asked for with another value", image_of(sample_data(), 0xFF), false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.what);
        attached_process(Bytes(kPersistentSize, 0x42));
        fake::write_file(kImagePath, row.file);
        EXPECT_EQ(bt_con_readFROM(), 0);
        EXPECT_EQ(difference(persistent(), row.loads ? sample_data() : default_data()), "");
        EXPECT_EQ(difference(*fake::read_file(kImagePath), row.loads ? row.file : defaults), "");
        EXPECT_EQ(fake::counted_calls(), row.loads ? 4u : 2u); // attaching makes two
        expect_rest_untouched();
    }
}

TEST(StoreImage, LoadPassesLockFailuresOn)
{
    const Bytes old(kPersistentSize, 0x42);
    for (const uint32_t n : {1u, 2u}) {
        attached_process(old);
        fake::write_file(kImagePath, image_of(sample_data()));
        fake::fail_nth(n);
        EXPECT_EQ(bt_con_readFROM(), n == 1 ? fake::kLockFailure : fake::kUnlockFailure);
        EXPECT_EQ(difference(persistent(), n == 1 ? old : sample_data()), "");
        EXPECT_EQ(fake::held_locks(), 0u);
    }
}

TEST(StoreImage, FileThatCannotBeUsedLeavesTheDefaultsInTheArea)
{
    const std::string path = fake::root() + kImagePath;
    const std::function<void()> files[] = {
        [] {}, // none
        [&] { std::filesystem::create_directory(path); },
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
        EXPECT_EQ(difference(persistent(), default_data()), "");
        close(pipe);
    }
    fake::remove_file(kImagePath);
}

TEST(StoreImage, WriteRewritesTheFileInPlace)
{
    attached_process(sample_data());
    fake::write_file(kImagePath, Bytes(kImageSize + 3, 0x77));
    EXPECT_EQ(bt_con_writeFROM(), 0);
    EXPECT_EQ(difference(*fake::read_file(kImagePath), image_of(sample_data()) + Bytes(3, 0x77)), "");
    fake::write_file(kImagePath, {});
    EXPECT_EQ(bt_con_writeFROM(), 0);
    EXPECT_EQ(difference(*fake::read_file(kImagePath), image_of(sample_data())), "");
    EXPECT_EQ(difference(persistent(), sample_data()), "");
}

TEST(StoreImage, ShortWriteIsReported)
{
    attached_process(sample_data());
    fake::write_file(kImagePath, {});
    rlimit usual{};
    ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &usual), 0);
    rlimit tight = usual;
    tight.rlim_cur = kImageSize - 1;
    const auto handler = signal(SIGXFSZ, SIG_IGN);
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &tight), 0);
    const int32_t result = bt_con_writeFROM();
    setrlimit(RLIMIT_FSIZE, &usual);
    signal(SIGXFSZ, handler);
    EXPECT_EQ(result, -1);
}

TEST(StoreImage, ResetOverwritesThePersistentPart)
{
    attached_process(sample_data());
    EXPECT_EQ(bt_con_initFROM(), 0);
    EXPECT_EQ(difference(persistent(), default_data()), "");
    EXPECT_EQ(difference(*fake::read_file(kImagePath), image_of(default_data())), "");
    EXPECT_EQ(fake::counted_calls(), 2u); // no lock
    expect_rest_untouched();
}

TEST(StoreImage, NothingHappensWithoutTheArea)
{
    fresh_process();
    for (int32_t (*const operation)() : {bt_con_writeFROM, bt_con_readFROM, bt_con_initFROM})
        EXPECT_EQ(operation(), -1);
    EXPECT_EQ(difference(*fake::read_file(kImagePath), stale_image()), "");
}

TEST(StoreImage, StartUpStatusDecidesWhetherTheDefaultsReplaceTheImage)
{
    const Bytes image = image_of(sample_data()), defaults = image_of(default_data()), old(kPersistentSize, 0x42);
    const struct {
        int32_t status, result;
        Bytes data, file;
        bool attaches;
    } rows[] = {
        {0, 1, default_data(), defaults, true},
        {1, 0, sample_data(), image, true},
        {2, 1, default_data(), defaults, true},
        {3, 1, old, image, false},
        {4, -1, old, image, false},
        {-1, -1, old, image, false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.status);
        fresh_process(old);
        fake::write_file(kImagePath, image);
        EXPECT_EQ(bt_con_checkBackUpData(row.status), row.result);
        EXPECT_EQ(difference(persistent(), row.data), "");
        EXPECT_EQ(difference(*fake::read_file(kImagePath), row.file), "");
        EXPECT_EQ(handle_area() != nullptr, row.attaches);
        expect_rest_untouched();

        fresh_process(old); // what the calls made answer is not reported
        fake::fail_from(1);
        EXPECT_EQ(bt_con_checkBackUpData(row.status), row.result);
        EXPECT_EQ(difference(persistent(), old), "");
    }
}
