#include "sim/shared_areas.h"

#include "sim/unit_records.h"

#include <bt_platform/host.h>
#include <fmt/format.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

namespace bt::sim {

namespace {

struct Area {
    const char* name;
    uint32_t size;
};

constexpr Area kAreas[] = {
    {"BT_CON_SHARE_DATA_NAME", 27796},
    {"BT_HFP_SHARE_DATA_NAME", 1084},
    {"/tmp/shm_eds_regist_table", 8004},
    {"/tmp/shm_sysmgr_local_devinfo", 348},
    {"/tmp/shm_avp_medialst", 28812},
    {"/tmp/shm_avp_playerlst", 30012},
    {"/tmp/shm_avp_media", 1060},
    {"/tmp/shm_map_serviceapi", 4096},
    {"/tmp/shm_map_getmsg", 73713},
    {"/tmp/shm_map_msglst", 247216},
    {"/tmp/shm_map_fldlst", 26004},
    {"/tmp/shm_map_pushmsg", 9652},
    {"/tmp/shm_map_insinfo", 940},
    {kUnitDataName, sizeof(BtSimUnit)},
    {kDistributorDataName, sizeof(BtSimDistributor)},
};

constexpr const char* kFolders[] = {"fs/tmpfs", "fs/rwdata/BT/btstack", "fs/sd0", "tmp"};
constexpr const char* kImageFile = "fs/tmpfs/btdevicelist.txt";

} // namespace

void create_areas()
{
    for (const Area& area : kAreas) {
        if (bt_host_create_data(area.name, area.size) < 0)
            throw UnitError(fmt::format("shared data {}: {}", area.name, bt_host_error()));
    }
}

void create_folders(const std::string& root)
{
    namespace fs = std::filesystem;
    std::error_code failure;
    for (const char* folder : kFolders) {
        fs::create_directories(fs::path(root) / folder, failure);
        if (failure)
            throw UnitError(
                fmt::format("{}/{}: {}; give a folder you may write to with --root", root, folder, failure.message()));
    }
    struct stat status {};
    if (stat(root.c_str(), &status) != 0 || status.st_uid != getuid())
        throw UnitError(fmt::format("{}: belongs to somebody else; give a folder of your own with --root", root));
    const fs::path image = fs::path(root) / kImageFile;
    if (!std::ofstream(image, std::ios::app))
        throw UnitError(fmt::format("{}: {}; make the file writable", image.string(), strerror(errno)));
}

} // namespace bt::sim
