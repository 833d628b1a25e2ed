// Collects what goes through the library's log pointer, in a form that rows of expected lines can be compared with.
#pragma once

#include <bt_service/bt_log.h>

#include <cstdarg>
#include <cstdio>
#include <regex>
#include <string>
#include <vector>

struct LogLine {
    std::string tag, format, text;
};

class LogCapture {
public:
    LogCapture() : before_(BT_CMN_logout_wrapperFunc)
    {
        lines().clear();
        BT_CMN_logout_wrapperFunc = record;
    }
    ~LogCapture() { BT_CMN_logout_wrapperFunc = before_; }
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;

    static std::vector<LogLine>& lines()
    {
        static std::vector<LogLine> collected;
        return collected;
    }

    // The collected texts, each "TAG|text". Within them "[API][<path>][<function>][<line>]" becomes "[api:<function>]",
    // "[model:<function>]" or keeps its path when it is neither; the source line is some number above zero.
    static std::vector<std::string> texts()
    {
        static const std::string base = "BT_Service/api/../thread/bt_srv_cmn/utility/src/bt_srv_cmn_";
        static const std::regex place(R"(\[API\]\[([^\]]*)\]\[([^\]]*)\]\[[1-9][0-9]*\])");
        std::vector<std::string> out;
        for (const LogLine& line : lines()) {
            std::smatch match;
            std::string text = line.text;
            if (std::regex_search(text, match, place)) {
                std::string path = match[1];
                if (path.compare(0, base.size(), base) == 0) path = path.substr(base.size());
                text = std::string(match.prefix()) + "[" + path + ":" + std::string(match[2]) + "]" +
                       std::string(match.suffix());
            }
            out.push_back(line.tag + "|" + text);
        }
        lines().clear();
        return out;
    }

private:
    static void record(const char* tag, const char* format, ...) BT_PRINTF(2, 3)
    {
        char text[2048];
        va_list arguments;
        va_start(arguments, format);
        std::vsnprintf(text, sizeof text, format, arguments);
        va_end(arguments);
        lines().push_back({tag, format, text});
    }

    BT_CMN_logout before_;
};

inline std::string pointer_text(const void* pointer)
{
    char text[32];
    std::snprintf(text, sizeof text, "%p", pointer);
    return text;
}
