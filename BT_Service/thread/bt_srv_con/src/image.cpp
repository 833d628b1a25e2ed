// The image file that mirrors the persistent part of the area: write, load, fall back to the defaults.
#include <cstdio>
#include <cstring>

#include "base/rooted_path.h"
#include "thread/bt_srv_con/src/area.h"
#include "thread/bt_srv_con/src/process_lock.h"

namespace bt::con {
namespace {

constexpr uint8_t kMagic[5] = {'B', 'T', 'C', 'N', 0};

// Threads that store without the area's lock write the image one after the other, each a copy made in its turn: the
// file ends up with the newest.
pthread_mutex_t g_image_file = PTHREAD_MUTEX_INITIALIZER;

// The image file at its start, unbuffered: each transfer is one call to the system.
class ImageFile {
public:
    explicit ImageFile(const char* mode) : file_(std::fopen(RootedPath(BT_CON_IMAGE_PATH).c_str(), mode))
    {
        if (file_ == nullptr) return;
        std::setvbuf(file_, nullptr, _IONBF, 0);
        at_start_ = std::fseek(file_, 0, SEEK_SET) == 0;
    }
    ~ImageFile()
    {
        if (file_ != nullptr) std::fclose(file_);
    }
    ImageFile(const ImageFile&) = delete;
    ImageFile& operator=(const ImageFile&) = delete;

    bool read(BtConFromImage& image) { return at_start_ && std::fread(&image, sizeof image, 1, file_) == 1; }
    bool write(const BtConFromImage& image) { return at_start_ && std::fwrite(&image, sizeof image, 1, file_) == 1; }

private:
    std::FILE* file_;
    bool at_start_ = false;
};

uint32_t checksum_of(const BtConPersistentData& data)
{
    return bt_con_calcSum(reinterpret_cast<const uint8_t*>(&data), sizeof data);
}

bool read_valid(BtConFromImage& image)
{
    const ProcessLock one_at_a_time(g_image_file);
    return ImageFile("rb").read(image) && std::memcmp(image.magic, kMagic, sizeof kMagic) == 0 &&
           image.checksum == checksum_of(image.data);
}

int32_t install(BtConShareData* attached, const BtConPersistentData& data)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();
    store(attached, &data, sizeof data);
    return lock.release();
}

enum class Loaded { kInstalled, kUnusable, kResetAsked };

// Not inlined: the image's bytes must be off the stack before a fallback writes an image of its own.
[[gnu::noinline]] Loaded load_image(BtConShareData* attached, int32_t& result)
{
    BtConFromImage image{};
    if (!read_valid(image)) return Loaded::kUnusable;
    if (image.init_request != 0) return Loaded::kResetAsked;
    result = install(attached, image.data);
    return Loaded::kInstalled;
}

} // namespace
} // namespace bt::con

using namespace bt::con;

uint32_t bt_con_calcSum(const uint8_t* bytes, int32_t length)
{
    if (bytes == nullptr) return 0;
    uint32_t sum = 0;
    for (int32_t i = 0; i < length; ++i)
        sum += bytes[i];
    return sum;
}

int32_t bt_con_writeFROM(void)
{
    const BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;

    const ProcessLock one_at_a_time(g_image_file);
    BtConFromImage image{};
    std::memcpy(image.magic, kMagic, sizeof kMagic);
    load(&image.data, attached, sizeof image.data);
    image.checksum = checksum_of(image.data);
    return ImageFile("r+b").write(image) ? BT_OK : BT_FAILED;
}

int32_t bt_con_readFROM(void)
{
    BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;

    int32_t result = BT_OK;
    const Loaded loaded = load_image(attached, result);
    if (loaded == Loaded::kInstalled) return result;

    result = bt_con_initFROM();
    if (loaded == Loaded::kUnusable || result != BT_OK) return result;
    return bt_con_writeFROM();
}

int32_t bt_con_initFROM(void)
{
    BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;

    store(attached, &g_con_data_from_init, sizeof g_con_data_from_init);
    return bt_con_writeFROM();
}

int32_t bt_con_checkBackUpData(int32_t status)
{
    switch (status) {
    case 0:
    case 2:
        bt_con_ApiInit(1);
        bt_con_initFROM();
        return 1;
    case 1:
        bt_con_ApiInit(1);
        return BT_OK;
    case 3:
        return 1;
    default:
        return BT_FAILED;
    }
}
