// Log output: the switch files, the four outputs, the service log file and the hex dump.
#include "fake_platform.h"

#include <bt_service/bt_log.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <regex>

namespace {

using fake::Bytes;

const char* const kMain = "/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG";
const char* const kFallback = "/fs/sd0/BT_SERVICE_DEBUG";
const char* const kLogFile = "/tmp/bt_cmn.log";
const std::string kStamp = R"([ 0-9]{4}/\d\d/\d\d \d\d:\d\d:\d\d\.\d{3} )";

Bytes bytes_of(const std::string& text)
{
    return Bytes(text.begin(), text.end());
}

std::string log_file()
{
    const auto content = fake::read_file(kLogFile);
    return content ? std::string(content->begin(), content->end()) : "";
}

bool matches(const std::string& text, const std::string& pattern)
{
    const bool match = std::regex_match(text, std::regex(pattern));
    if (!match) ADD_FAILURE() << "text: " << text << "\npattern: " << pattern;
    return match;
}

std::string literal(const std::string& text)
{
    return std::regex_replace(text, std::regex(R"([.^$|()\[\]{}*+?\\])"), R"(\$&)");
}

class Log : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        fake::remove_file("/fs");
        fake::remove_file(kLogFile);
        BT_CMN_DebugLogSelecter();
        fake::reset();
    }

    void TearDown() override { select(""); }

    static std::string select(const std::string& switches)
    {
        fake::write_file(kMain, bytes_of(switches));
        BT_CMN_DebugLogSelecter();
        return {static_cast<char>('0' + DebugConsoleLogSts), static_cast<char>('0' + DebugFileOutLogSts),
                static_cast<char>('0' + DebugSRVOutLogSts), static_cast<char>('0' + DebugStrmLogStsOn)};
    }

    static std::vector<std::string> zel(int64_t level)
    {
        std::vector<std::string> texts;
        for (const fake::LogRecord& record : fake::logs())
            if (record.channel == "ZelLog" && record.numbers[0] == level) texts.push_back(record.text);
        return texts;
    }
};

TEST_F(Log, LoadsWithNothingOn)
{
    EXPECT_STREQ(AppName, "BT_Service");
    Bytes block(12120, 0);
    block[0] = 2;
    const std::pair<size_t, const char*> zones[] = {{10, "Init"},         {11, "Function"},  {12, "Memory"},
                                                    {13, "Console Logs"}, {14, "File Logs"}, {29, "Info"},
                                                    {30, "Warning"},      {31, "Error"}};
    for (const auto& [zone, name] : zones)
        std::memcpy(&block[1 + 24 * (zone - 10)], name, std::strlen(name));
    const uint32_t words[] = {31, 30, 29, 14, 13, 12, 11, 10};
    std::memcpy(&block[12052], words, sizeof words);

    static_assert(sizeof g_VexLogParams == 12120);
    EXPECT_EQ(std::memcmp(&g_VexLogParams, block.data(), block.size()), 0);
}

TEST_F(Log, SwitchFileLinesSelectTheFlags)
{
    const std::string filler(49, 'x');
    const std::pair<std::string, std::string> rows[] = {
        // file content, then console, file, trace, stream
        {"", "0010"},
        {"@ConsoleLog=ON;\n", "1010"},
        {"@ConsoleLog=ON;", "1010"},
        {"@ConsoleLog=ON\n", "0010"},
        {"@ConsoleLog=ON", "0010"},
        {"@ConsoleLog=OFF;\n", "0010"},
        {"@ConsoleLog=on;\n", "0010"},
        {"#@ConsoleLog=ON;\n", "0010"},
        {" @ConsoleLog=ON;\n", "0010"},
        {"@ConsoleLog =ON;\n", "0010"},
        {"@ConsoleLog= ON;\n", "0010"},
        {"@ConsoleLogs=ON;\n", "0010"},
        {"@FileOutLog=ON;\n", "0110"},
        {"@ConsoleSRVLog=OFF;\n", "0010"},
        {"@ConsoleSRVLog=ON;\n", "0010"},
        {"@StrmLog=ON;\n", "0011"},
        {"@ConsoleLog=ON;\n@ConsoleLog=OFF;\n", "1010"},
        {"@ConsoleLog=OFF;\n@ConsoleLog=ON;\n@FileOutLog=ON;\n@StrmLog=ON;\n", "1111"},
        {"@ConsoleLog=ON; with a remark\n", "1010"},
        {"nothing\n\n=ON;\n;\n@FileOutLog=ON;\n", "0110"},
        {filler + "@ConsoleLog=ON;\n", "1010"}, // the second piece is a line of its own
        {filler.substr(1) + "@ConsoleLog=ON;\n", "0010"}, // the key is cut apart
    };
    for (const auto& [content, expected] : rows)
        EXPECT_EQ(select(content), expected) << content;

    DebugConsoleLogSts = DebugFileOutLogSts = 1;
    DebugSRVOutLogSts = 0;
    DebugStrmLogStsOn = 1;
    EXPECT_EQ(select(""), "0010") << "a selection starts from the defaults";
}

TEST_F(Log, FallbackFileIsReadOnlyWhenTheFirstCannotBeOpened)
{
    const std::string usb = "BT_SERVICE_DEBUG：fopen_error(USB)\n", sd = "BT_SERVICE_DEBUG：fopen_error(SD)\n";
    BT_CMN_DebugLogSelecter();
    EXPECT_THAT(zel(1), testing::ElementsAre(usb, sd));
    EXPECT_EQ(BT_CMN_logout_wrapperFunc, _BT_CMN_logout_Stub);
    EXPECT_EQ(DebugSRVOutLogSts, 1);

    fake::reset();
    fake::write_file(kFallback, bytes_of("@FileOutLog=ON;\n"));
    BT_CMN_DebugLogSelecter();
    EXPECT_THAT(zel(1),
                testing::ElementsAre(usb, "DebugConsoleLogSts:[0] DebugFileOutLogSts:[1] DebugSRVOutLogSts:[1]\n"));

    fake::reset();
    EXPECT_EQ(select("@ConsoleLog=ON;\n"), "1010");
    EXPECT_THAT(zel(1), testing::ElementsAre("DebugConsoleLogSts:[1] DebugFileOutLogSts:[0] DebugSRVOutLogSts:[1]\n"));
}

TEST_F(Log, AttachChoosesOutputAndZone)
{
    struct Row {
        uint8_t console, file;
        BT_CMN_logout output;
        int32_t zone;
    };
    const Row rows[] = {{0, 0, _BT_CMN_logout_Stub, 13},
                        {0, 1, _BT_CMN_logout_File, 14},
                        {1, 0, _BT_CMN_logout_Console, 13},
                        {1, 1, _BT_CMN_logout_Console_And_File, 13},
                        {2, 0, _BT_CMN_logout_Console_And_File, 13},
                        {0, 2, _BT_CMN_logout_Console_And_File, 13}};
    for (const Row& row : rows) {
        fake::reset();
        DebugConsoleLogSts = row.console;
        DebugFileOutLogSts = row.file;
        BT_CMN_log_AttachFuncPointer();
        EXPECT_EQ(BT_CMN_logout_wrapperFunc, row.output) << +row.console << +row.file;
        EXPECT_EQ(VEXLOG_Zone, row.zone);
        ASSERT_EQ(fake::logs().size(), 2u);
        EXPECT_EQ(fake::logs()[0].channel, "QvLogSetZones");
        EXPECT_THAT(fake::logs()[0].numbers, testing::ElementsAre(8, 31, 30, 29, 14, 13, 12, 11, 10));
        EXPECT_EQ(fake::logs()[1].text, "BT_Service");
    }
    bt_cmn_log_fp_reset();
}

TEST_F(Log, RecordsEndInOneNewlineUnlessTheFormatHasIt)
{
    select("@FileOutLog=ON;\n");
    struct Row {
        const char *format, *argument, *written;
    };
    const Row rows[] = {{"%s", "plain", "plain\n"},
                        {"%s\n", "plain", "plain\n"},
                        {"%s", "ends\n", "ends\n\n"},
                        {"", "", "\n"},
                        {"%s\n\n", "two", "two\n\n"}};
    for (const Row& row : rows) {
        for (const BT_CMN_logout output :
             {_BT_CMN_logout_Console, _BT_CMN_logout_File, _BT_CMN_logout_Console_And_File}) {
            const size_t before = log_file().size();
            testing::internal::CaptureStdout();
            output("CMN", row.format, row.argument);
            std::fflush(stdout);
            const std::string console = testing::internal::GetCapturedStdout();
            const std::string file = log_file().substr(before);
            const std::string expected = kStamp + "\\[CMN\\] " + literal(row.written);
            if (output != _BT_CMN_logout_File) {
                EXPECT_TRUE(matches(console, expected));
            } else {
                EXPECT_EQ(console, "");
            }
            if (output != _BT_CMN_logout_Console) {
                EXPECT_TRUE(matches(file, expected));
            } else {
                EXPECT_EQ(file, "");
            }
            if (output == _BT_CMN_logout_Console_And_File) {
                EXPECT_EQ(console, file) << "one timestamp for both";
            }
        }
    }
}

TEST_F(Log, NullTagOrFormatWritesNothingAndLongTagsAreCutOnTheConsole)
{
    select("@FileOutLog=ON;\n");
    const std::string tag(200, 't');
    const char* const no_format = nullptr;
    testing::internal::CaptureStdout();
    for (const BT_CMN_logout output :
         {_BT_CMN_logout_Stub, _BT_CMN_logout_Console, _BT_CMN_logout_File, _BT_CMN_logout_Console_And_File}) {
        output(nullptr, "%s", "x");
        output("CMN", no_format);
    }
    _BT_CMN_logout_Stub("CMN", "%s", "stub");
    EXPECT_EQ(log_file(), "");
    _BT_CMN_logout_Console_And_File(tag.c_str(), "%d", 7);
    std::fflush(stdout);
    EXPECT_TRUE(matches(testing::internal::GetCapturedStdout(), kStamp + "\\[" + tag.substr(0, 127) + "\\] 7\n"));
    EXPECT_TRUE(matches(log_file(), kStamp + "\\[" + tag + "\\] 7\n"));
}

TEST_F(Log, LogFileIsOpenedOnceAndAgainOnlyAfterAReset)
{
    std::FILE* const stream = bt_cmn_log_fpget();
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(bt_cmn_log_fpget(), stream);
    EXPECT_NE(fcntl(fileno(stream), F_GETFD) & FD_CLOEXEC, 0);
    std::fputs("kept\n", stream);
    std::fflush(stream);

    bt_cmn_log_fp_reset();
    ASSERT_NE(bt_cmn_log_fpget(), nullptr);
    EXPECT_EQ(log_file(), "kept\n") << "appended to, never truncated";

    bt_cmn_log_fp_reset();
    const std::string folder = fake::root() + "/tmp", away = fake::root() + "/elsewhere";
    std::filesystem::rename(folder, away);
    EXPECT_EQ(bt_cmn_log_fpget(), nullptr);
    testing::internal::CaptureStdout();
    _BT_CMN_logout_Console_And_File("CMN", "still on the console");
    std::fflush(stdout);
    EXPECT_THAT(testing::internal::GetCapturedStdout(), testing::HasSubstr("still on the console\n"));
    std::filesystem::rename(away, folder);
    EXPECT_EQ(bt_cmn_log_fpget(), nullptr) << "no new attempt before a reset";
    bt_cmn_log_fp_reset();
    EXPECT_NE(bt_cmn_log_fpget(), nullptr);
}

TEST_F(Log, TimePrintWritesTheTimeOfDay)
{
    std::FILE* const file = std::tmpfile();
    BT_CMN_DebugLogTimePrint(nullptr);
    BT_CMN_DebugLogTimePrint(file);
    std::rewind(file);
    char text[64] = "";
    ASSERT_NE(std::fgets(text, sizeof text, file), nullptr);
    std::fclose(file);
    EXPECT_TRUE(matches(text, R"(\d\d:\d\d:\d\d\.\d{3} )"));
}

TEST_F(Log, OnlyTheStreamProcessNeedsItsSwitchForTheTrace)
{
    const struct {
        uint32_t pno;
        int32_t stream, expected;
    } rows[] = {{0x08C2, 0, 1}, {0x08C2, 1, 1}, {0x08C5, 0, 0}, {0x08C5, 1, 1}, {0, 0, 1}};
    for (const auto& row : rows) {
        fake::set_pno(row.pno);
        DebugStrmLogStsOn = row.stream;
        EXPECT_EQ(BT_CMN_DebugLogThreadIdFilter(nullptr), row.expected) << row.pno << " " << row.stream;
    }
    DebugStrmLogStsOn = 0;
}

TEST_F(Log, DumpShowsSixteenBytesALine)
{
    Bytes data(5000);
    for (size_t i = 0; i < data.size(); ++i)
        data[i] = static_cast<uint8_t>(0x41 + i % 16);
    const std::string full = "  4142 4344 4546 4748 494a 4b4c 4d4e 4f50   ABCDEFGH IJKLMNOP ";
    const std::string one = "  41" + std::string(40, ' ') + "A" + std::string(17, ' ');
    const std::string mixed = "  1f20 7e7f 80ff" + std::string(28, ' ') + ". ~..." + std::string(12, ' ');
    ASSERT_EQ(full.size(), 62u);
    ASSERT_EQ(one.size(), 62u);
    ASSERT_EQ(mixed.size(), 62u);
    const Bytes odd = fake::hex("1F 20 7E 7F 80 FF");

    struct Row {
        const uint8_t* data;
        int32_t size;
        size_t lines;
        std::string first, last;
    };
    const Row rows[] = {{data.data(), 16, 1, full, full},
                        {data.data(), 17, 2, full, one},
                        {data.data(), 1, 1, one, one},
                        {odd.data(), 6, 1, mixed, mixed},
                        {data.data(), 2048, 128, full, full},
                        {data.data(), 5000, 128, full, full},
                        {data.data(), INT32_MAX, 128, full, full}};
    for (const Row& row : rows) {
        select("@ConsoleLog=ON;\n@FileOutLog=ON;\n");
        fake::reset();
        const size_t before = log_file().size();
        testing::internal::CaptureStdout();
        BT_CMN_logdump("CMN", "title", row.data, row.size);
        std::fflush(stdout);
        const std::string header = kStamp + "\\[CMN\\] <size=" + std::to_string(row.size) + "> : title\n";
        EXPECT_TRUE(matches(testing::internal::GetCapturedStdout(), header));

        const std::vector<std::string> lines = zel(4);
        ASSERT_EQ(lines.size(), row.lines);
        EXPECT_EQ(lines.front(), row.first + "\n");
        EXPECT_EQ(lines.back(), row.last + "\n");
        std::string body;
        for (const std::string& line : lines)
            body += line;
        const std::string file = log_file().substr(before);
        EXPECT_EQ(file.substr(file.find('\n') + 1), body);
        EXPECT_TRUE(matches(file.substr(0, file.find('\n') + 1), header));
    }
}

TEST_F(Log, DumpGoesWhereTheFlagsSay)
{
    const uint8_t byte = 0x41;
    const struct {
        const char *tag, *title;
        const uint8_t* data;
        int32_t size;
    } refused[] = {{nullptr, "t", &byte, 1},
                   {"CMN", nullptr, &byte, 1},
                   {"CMN", "t", nullptr, 1},
                   {"CMN", "t", &byte, 0},
                   {"CMN", "t", &byte, -1}};
    select("@ConsoleLog=ON;\n@FileOutLog=ON;\n");
    fake::reset();
    testing::internal::CaptureStdout();
    for (const auto& row : refused)
        BT_CMN_logdump(row.tag, row.title, row.data, row.size);
    select("");
    fake::reset();
    BT_CMN_logdump("CMN", "t", &byte, 1);
    select("@FileOutLog=ON;\n");
    fake::reset();
    BT_CMN_logdump("CMN", "t", &byte, 1);
    std::fflush(stdout);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "") << "nothing on the console";
    EXPECT_TRUE(zel(4).empty());
    EXPECT_TRUE(matches(log_file(), kStamp + "\\[CMN\\] <size=1> : t\n  41 {40}A {17}\n"));

    // File output wanted, but no file: the dump ends behind its console header.
    select("@ConsoleLog=ON;\n@FileOutLog=ON;\n");
    fake::reset();
    fake::remove_file("/tmp");
    testing::internal::CaptureStdout();
    BT_CMN_logdump("CMN", "t", &byte, 1);
    std::fflush(stdout);
    EXPECT_TRUE(matches(testing::internal::GetCapturedStdout(), kStamp + "\\[CMN\\] <size=1> : t\n"));
    EXPECT_TRUE(zel(4).empty());
    std::filesystem::create_directories(fake::root() + "/tmp");
    bt_cmn_log_fp_reset();
}

} // namespace
