// Collects what goes through the library's log pointer and what its outputs write, for comparison with expected lines.
#pragma once

#include "fake_platform.h"

#include <bt_service/bt_log.h>
#include <gtest/gtest.h>

#include <cstdarg>
#include <cstdio>
#include <regex>

using Lines = std::vector<std::string>;

inline Lines g_collected; // each "TAG|text"

inline void collect_line(const char* tag, const char* format, ...) BT_PRINTF(2, 3);
inline void collect_line(const char* tag, const char* format, ...)
{
    char text[2048];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    g_collected.push_back(std::string(tag) + "|" + text);
}

// The lines of that tag which `body` logs. Within them "[API][<path>][<function>][<line>]" becomes "[api:<function>]" or
// "[model:<function>]"; it stays as it is when the path is neither or the source line is not a number above zero.
inline Lines logged(const std::string& tag, const std::function<void()>& body)
{
    static const std::regex place(R"(\[API\]\[BT_Service/api/\.\./thread/bt_srv_cmn/utility/src/bt_srv_cmn_)"
                                  R"((api|model)\]\[([^\]]*)\]\[[1-9][0-9]*\])");
    const BT_CMN_logout before = BT_CMN_logout_wrapperFunc;
    BT_CMN_logout_wrapperFunc = collect_line;
    g_collected.clear();
    body();
    BT_CMN_logout_wrapperFunc = before;
    Lines lines;
    for (const std::string& line : g_collected)
        if (line.compare(0, tag.size() + 1, tag + "|") == 0)
            lines.push_back(std::regex_replace(line.substr(tag.size() + 1), place, "[$1:$2]"));
    return lines;
}

inline std::string pointer_text(const void* pointer)
{
    char text[32];
    std::snprintf(text, sizeof text, "%p", pointer);
    return text;
}

inline const char* const kLogFile = "/tmp/bt_cmn.log";

struct Outputs {
    std::string console, file;
    size_t unflushed; // bytes of the file
};

// What `body` writes to standard output and appends to the log file.
inline Outputs outputs_of(const std::function<void()>& body)
{
    const size_t before = fake::read_file(kLogFile).value_or(fake::Bytes()).size();
    testing::internal::CaptureStdout();
    body();
    const size_t flushed = fake::read_file(kLogFile).value_or(fake::Bytes()).size();
    std::fflush(nullptr);
    const fake::Bytes file = fake::read_file(kLogFile).value_or(fake::Bytes());
    return {testing::internal::GetCapturedStdout(), std::string(file.begin(), file.end()).substr(before),
            file.size() - flushed};
}
