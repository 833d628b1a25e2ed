#include "switch_file.h"

#include <bt_service/bt_log.h>

#include <cstring>

namespace bt::cmn {
namespace {

constexpr int kLineBuffer = 50; // a longer line is read in pieces, each taken for a line
constexpr char kOn[] = "ON";

// Cuts the line into key and value. The value has to be closed, so that a line cut short matches nothing.
bool split(char* line, const char** key, const char** value)
{
    char* const equals = std::strchr(line, '=');
    if (line[0] == '#' || equals == nullptr) return false;
    char* const end = std::strchr(equals, ';');
    if (end == nullptr) return false;

    *equals = '\0';
    *end = '\0';
    *key = line;
    *value = equals + 1;
    return true;
}

void switch_on(const char* key)
{
    if (std::strcmp(key, "@ConsoleLog") == 0) DebugConsoleLogSts = 1;
    if (std::strcmp(key, "@FileOutLog") == 0) DebugFileOutLogSts = 1;
    if (std::strcmp(key, "@ConsoleSRVLog") == 0) DebugSRVOutLogSts = 1;
    if (std::strcmp(key, "@StrmLog") == 0) DebugStrmLogStsOn = 1;
}

} // namespace

void read_switches(std::FILE* file)
{
    char line[kLineBuffer];
    while (std::fgets(line, sizeof line, file) != nullptr) {
        const char* key = nullptr;
        const char* value = nullptr;
        if (split(line, &key, &value) && std::strcmp(value, kOn) == 0) switch_on(key);
    }
}

} // namespace bt::cmn
