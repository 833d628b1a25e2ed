// The verdict on the image file of the connection data.
#include "btsvc/status.h"
#include "catalogue/print.h"

#include "base/rooted_path.h"

#include <bt_service/bt_connection_records.h>
#include <bt_service/bt_connection_store.h>

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>

namespace bt::client {
namespace {

struct Verdict {
    bool valid;
    std::string text;
    int32_t devices = 0;
};

struct CloseFile {
    void operator()(std::FILE* file) const { std::fclose(file); }
};

Verdict judge(const BtConFromImage& image)
{
    static constexpr char kMagic[5] = "BTCN";
    if (std::memcmp(image.magic, kMagic, sizeof kMagic) != 0) return {false, "its magic is wrong"};

    const auto* data = reinterpret_cast<const uint8_t*>(&image.data);
    const uint32_t checksum = bt_con_calcSum(data, sizeof image.data);
    if (checksum != image.checksum)
        return {false, fmt::format("its checksum is {}, its data sum up to {}", image.checksum, checksum)};

    const int32_t devices =
        std::clamp<int32_t>(image.data.registered_device_list_info.device_num, 0, BT_CON_DEVICE_MAX);
    return {true, image.init_request == 0 ? "good" : "good, but asks for a reset to the defaults", devices};
}

Verdict judge_file(const std::string& path)
{
    const std::unique_ptr<std::FILE, CloseFile> file(std::fopen(path.c_str(), "rb"));
    if (!file) return {false, fmt::format("cannot be opened: {}", std::strerror(errno))};

    const auto image = std::make_unique<BtConFromImage>();
    const size_t got = std::fread(image.get(), 1, sizeof *image, file.get());
    if (got < sizeof *image) return {false, fmt::format("has {} bytes, {} are needed", got, sizeof *image)};
    return judge(*image);
}

std::string image_path(const std::string& unit_root)
{
    const char* chosen = std::getenv("BT_SERVICE_ROOT");
    return chosen != nullptr && *chosen != '\0' ? RootedPath(BT_CON_IMAGE_PATH).c_str() : unit_root + BT_CON_IMAGE_PATH;
}

} // namespace

void report_image(const std::string& unit_root, Output& output)
{
    const std::string path = image_path(unit_root);
    Verdict verdict = judge_file(path);
    if (!verdict.valid) verdict = judge_file(path); // the unit may have been writing it at that moment

    if (output.json())
        output.object({{"type", "image"},
                       {"path", path},
                       {"valid", verdict.valid},
                       {"verdict", verdict.text},
                       {"devices", verdict.devices}});
    else
        output.line(fmt::format("\nImage file {}\n{}{}", catalogue::printable(path), verdict.text,
                                verdict.valid
                                    ? fmt::format(", devices: {}", verdict.devices)
                                    : "; the next start of the connection service replaces it by the defaults"));
}

} // namespace bt::client
