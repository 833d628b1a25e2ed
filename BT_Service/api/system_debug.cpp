// The debug switch files, and the export of the logs that they switch on.

#include "base/rooted_path.h"
#include "wire/post.h"

#include <bt_service/bt_system.h>

#include <sys/stat.h>

#include <cstdio>
#include <cstring>

using bt::Request;
using bt::RootedPath;

namespace {

struct SwitchFile {
    const char* path;
    uint32_t first_switch;
    uint32_t switches;
    const char* keys[5];
};

constexpr SwitchFile kSwitchFiles[] = {
    {"/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG",
     BT_SYS_DEBUG_SERVICE_CONSOLE,
     4,
     {"@ConsoleLog", "@FileOutLog", "@ConsoleSRVLog", "@StrmLog"}},
    {"/fs/rwdata/BT/btstack/BT_STACK_DEBUG",
     BT_SYS_DEBUG_STACK_AIR,
     5,
     {"@AirLog", "@ConsoleLog", "@FileOutLog", "@ConsoleSTKLog", "@OsApiLog"}},
};

constexpr const char* kLogFiles[] = {"/tmp/bt_cmn.log", "/tmp/bt_stk.log", "/tmp/osapi.log"};
constexpr size_t kExportPathSize = 254; // of a copied log, its closing zero included

void remove_switch_files()
{
    for (const SwitchFile& file : kSwitchFiles) {
        std::remove(RootedPath(file.path).c_str());
    }
}

void write_switches(const SwitchFile& file, const uint32_t* switches)
{
    std::FILE* const stream = std::fopen(RootedPath(file.path).c_str(), "a");
    if (stream == nullptr) return;

    for (uint32_t i = 0; i < file.switches; ++i) {
        if (switches[file.first_switch + i] == 1) std::fprintf(stream, "%s=%s;\n", file.keys[i], "ON");
    }
    std::fclose(stream);
}

bool is_same_file(std::FILE* open, const char* path)
{
    struct stat one;
    struct stat other;
    return fstat(fileno(open), &one) == 0 && stat(path, &other) == 0 && one.st_dev == other.st_dev &&
           one.st_ino == other.st_ino;
}

void copy_bytes(std::FILE* source, std::FILE* destination)
{
    char buffer[512];
    while (const size_t length = std::fread(buffer, 1, sizeof buffer, source)) {
        std::fwrite(buffer, 1, length, destination);
    }
}

void copy_file(const char* from, const char* to)
{
    std::FILE* const source = std::fopen(from, "rb");
    if (source == nullptr) return;

    // Opening a log for writing empties it, so one that lies in its place already stays as it is.
    std::FILE* const destination = is_same_file(source, to) ? nullptr : std::fopen(to, "wb");
    if (destination != nullptr) {
        copy_bytes(source, destination);
        std::fclose(destination);
    }
    std::fclose(source);
}

void copy_log(const char* directory, const char* log)
{
    char to[kExportPathSize];
    const int length = std::snprintf(to, sizeof to, "%s%s", directory, std::strrchr(log, '/'));
    if (length < 0 || static_cast<size_t>(length) >= sizeof to) return;

    copy_file(RootedPath(log).c_str(), to);
}

bool can_export_to(const char* directory)
{
    struct stat entry;
    return directory != nullptr && stat(directory, &entry) == 0 && std::strlen(directory) + 1 <= kExportPathSize;
}

} // namespace

int32_t BT_SRV_requestDebugEnable(const uint32_t* switches)
{
    if (switches == nullptr) return BT_FAILED;

    remove_switch_files();
    for (const SwitchFile& file : kSwitchFiles) {
        write_switches(file, switches);
    }
    return bt::post(PNO_BT_SYS, Request::requestDebugEnable);
}

int32_t BT_SRV_requestDebugDisable()
{
    remove_switch_files();
    return bt::post(PNO_BT_SYS, Request::requestDebugDisable);
}

int32_t BT_SRV_requestDebugOutput(const char* directory)
{
    if (!can_export_to(directory)) return BT_FAILED;

    for (const char* const log : kLogFiles) {
        copy_log(directory, log);
    }
    remove_switch_files();
    return BT_OK;
}
