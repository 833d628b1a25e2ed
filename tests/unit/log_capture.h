// Collects what goes through the library's log pointer, in a form that rows of expected lines can be compared with.
#pragma once

#include <bt_service/bt_log.h>

#include <cstdarg>
#include <cstdio>
#include <functional>
#include <regex>
#include <string>
#include <vector>

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
