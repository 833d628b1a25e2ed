// Log output: the switch files, the four outputs, the service log file and the hex dump.
#include "log_capture.h"

#include <fcntl.h>
#include <gmock/gmock.h>

#include <cstring>
#include <filesystem>

namespace {

using fake::Bytes;
using testing::ElementsAre;

const char* const kMain = "/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG";
const char* const kFallback = "/fs/sd0/BT_SERVICE_DEBUG";

void write_switches(const char* path, const std::string& switches)
{
    fake::write_file(path, Bytes(switches.begin(), switches.end()));
}

// Before any test; the time zone tells local time from UTC.
const std::vector<int64_t> kWhenLoaded = {
    DebugConsoleLogSts + DebugFileOutLogSts + DebugSRVOutLogSts + DebugStrmLogStsOn, VEXLOG_Zone,
    BT_CMN_logout_wrapperFunc == _BT_CMN_logout_Stub, setenv("TZ", "IST-5:30", 1)};

// Expects the text behind the present time, or nothing at all for no text.
void expect_record(const std::string& got, const std::string& text)
{
    static const std::regex stamp(R"([ 0-9]{4}/\d\d/\d\d \d\d:\d\d:\d\d\.\d{3} )");
    const std::string time = got.substr(0, 24);
    EXPECT_EQ(got.substr(time.size()), text);
    if (text.empty()) return;
    EXPECT_TRUE(std::regex_match(time, stamp)) << got;
    std::tm at{};
    at.tm_isdst = -1;
    strptime(time.c_str(), "%Y/%m/%d %H:%M:%S", &at);
    EXPECT_NEAR(std::difftime(std::mktime(&at), std::time(nullptr)), 0, 60) << got;
}

std::vector<std::string> zel(int64_t level)
{
    std::vector<std::string> texts;
    for (const fake::LogRecord& record : fake::logs())
        if (record.channel == "ZelLog" && record.numbers[0] == level) texts.push_back(record.text);
    return texts;
}

class Log : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        fake::remove_file("/fs");
        fake::remove_file(kLogFile);
        bt_cmn_log_fp_reset();
    }
    void TearDown() override { select(""); }

    // The flags for console, file, trace and stream that the switches select.
    static std::string select(const std::string& switches)
    {
        write_switches(kMain, switches);
        BT_CMN_DebugLogSelecter();
        return {static_cast<char>('0' + DebugConsoleLogSts), static_cast<char>('0' + DebugFileOutLogSts),
                static_cast<char>('0' + DebugSRVOutLogSts), static_cast<char>('0' + DebugStrmLogStsOn)};
    }
};

TEST_F(Log, ParametersOfThePlatformLogger)
{
    EXPECT_THAT(kWhenLoaded, ElementsAre(0, 28, 1, 0));
    EXPECT_STREQ(AppName, "BT_Service");
    Bytes block(12120, 0);
    block[0] = 2;
    const std::pair<size_t, std::string> zones[] = {{10, "Init"},         {11, "Function"},  {12, "Memory"},
                                                    {13, "Console Logs"}, {14, "File Logs"}, {29, "Info"},
                                                    {30, "Warning"},      {31, "Error"}};
    for (const auto& [zone, name] : zones)
        std::memcpy(&block[1 + 24 * (zone - 10)], name.data(), name.size());
    const uint32_t words[] = {31, 30, 29, 14, 13, 12, 11, 10};
    std::memcpy(&block[12052], words, sizeof words);
    static_assert(sizeof g_VexLogParams == 12120);
    EXPECT_EQ(std::memcmp(&g_VexLogParams, block.data(), block.size()), 0);
}

TEST_F(Log, SwitchFileLinesSelectTheFlags)
{
    const std::string filler(49, 'x');
    const std::pair<std::string, std::string> rows[] = {
        {"@ConsoleLog=ON;", "1010"}, // console, file, trace, stream
        {"@ConsoleLog=ON\n", "0010"},
        {"@ConsoleLog=on;\n", "0010"},
        {"#@ConsoleLog=ON;\n", "0010"},
        {" @ConsoleLog=ON;\n", "0010"},
        {"@ConsoleLog= ON;\n", "0010"},
        {"@ConsoleLogs=ON;\n", "0010"},
        {"@ConsoleSRVLog=OFF;\n", "0010"},
        {"@ConsoleLog=OFF;\n@FileOutLog=ONE;\n", "0010"},
        {"@ConsoleLog=OFF;\n@ConsoleLog=ON;\n@FileOutLog=ON;\n@ConsoleSRVLog=ON;\n@StrmLog=ON;\n", "1111"},
        {"", "0010"}, // a selection starts from the defaults
        {"@ConsoleLog=ON;\n@ConsoleLog=OFF;\n", "1010"},
        {"@ConsoleLog=ON; with a remark\n", "1010"},
        {"nothing\n\n=ON;\n;\n@FileOutLog=ON;\n", "0110"},
        {filler + "@StrmLog=ON;\n", "0011"}, // the second piece is a line of its own
        {filler.substr(1) + "@ConsoleLog=ON;\n", "0010"}, // the key is cut apart
    };
    for (const auto& [content, expected] : rows)
        EXPECT_EQ(select(content), expected) << content;
}

// A process reads its root once, so this comes before all others.
using LogDeathTest = Log;

TEST_F(LogDeathTest, PathsBeginWithTheRootIfAnyAndAreNeverCut)
{
    write_switches(kMain, "");
    std::string too_long = fake::root();
    while (too_long.size() < 768)
        too_long += "/.";
    const std::pair<std::string, size_t> rows[] = {{fake::root(), 1}, {too_long, 2}, {"", 2}}; // none found: two errors
    for (const auto& [root, lines] : rows)
        EXPECT_TRUE(fake::in_child([root = root, lines = lines] {
            root.empty() ? unsetenv("BT_SERVICE_ROOT") : setenv("BT_SERVICE_ROOT", root.c_str(), 1);
            BT_CMN_DebugLogSelecter();
            EXPECT_EQ(zel(1).size(), lines);
        })) << root;
}

TEST_F(Log, FallbackFileIsReadOnlyWhenTheFirstCannotBeOpened)
{
    const std::string usb = "BT_SERVICE_DEBUG：fopen_error(USB)\n", sd = "BT_SERVICE_DEBUG：fopen_error(SD)\n";
    BT_CMN_DebugLogSelecter();
    EXPECT_THAT(zel(1), ElementsAre(usb, sd));
    EXPECT_EQ(BT_CMN_logout_wrapperFunc, _BT_CMN_logout_Stub);
    EXPECT_EQ(DebugSRVOutLogSts, 1);

    fake::reset();
    write_switches(kFallback, "@FileOutLog=ON;\n");
    BT_CMN_DebugLogSelecter();
    EXPECT_THAT(zel(1), ElementsAre(usb, "DebugConsoleLogSts:[0] DebugFileOutLogSts:[1] DebugSRVOutLogSts:[1]\n"));

    fake::reset();
    EXPECT_EQ(select("@ConsoleLog=ON;\n"), "1010");
    EXPECT_THAT(zel(1), ElementsAre("DebugConsoleLogSts:[1] DebugFileOutLogSts:[0] DebugSRVOutLogSts:[1]\n"));
}

TEST_F(Log, AttachChoosesOutputAndZone)
{
    const struct {
        uint8_t console, file;
        BT_CMN_logout output;
        int32_t zone;
    } rows[] = {{0, 0, _BT_CMN_logout_Stub, 13},
                {0, 1, _BT_CMN_logout_File, 14},
                {1, 0, _BT_CMN_logout_Console, 13},
                {1, 1, _BT_CMN_logout_Console_And_File, 13},
                {2, 0, _BT_CMN_logout_Console_And_File, 13},
                {0, 2, _BT_CMN_logout_Console_And_File, 13}};
    for (const auto& row : rows) {
        fake::reset();
        DebugConsoleLogSts = row.console;
        DebugFileOutLogSts = row.file;
        BT_CMN_log_AttachFuncPointer();
        EXPECT_EQ(BT_CMN_logout_wrapperFunc, row.output) << +row.console << +row.file;
        EXPECT_EQ(VEXLOG_Zone, row.zone);
        ASSERT_EQ(fake::logs().size(), 2u);
        EXPECT_EQ(fake::logs()[0].channel, "QvLogSetZones");
        EXPECT_THAT(fake::logs()[0].numbers, ElementsAre(8, 31, 30, 29, 14, 13, 12, 11, 10));
        EXPECT_EQ(fake::logs()[1].text, "BT_Service");
    }
}

TEST_F(Log, RecordsEndInOneNewlineUnlessTheFormatHasIt)
{
    const std::string tag(200, 't');
    const char *const none = nullptr, *const cmn = "CMN";
    const struct {
        const char *tag, *format, *argument;
        std::string console, file;
    } rows[] = {{cmn, "%s", "plain", "[CMN] plain\n", "[CMN] plain\n"},
                {cmn, "%s\n", "plain", "[CMN] plain\n", "[CMN] plain\n"},
                {cmn, "%s", "ends\n", "[CMN] ends\n\n", "[CMN] ends\n\n"},
                {cmn, "", "", "[CMN] \n", "[CMN] \n"},
                {cmn, "\n", "", "[CMN] \n", "[CMN] \n"},
                {tag.c_str(), "%s", "7", "[" + tag.substr(0, 127) + "] 7\n", "[" + tag + "] 7\n"},
                {none, "%s", "x", "", ""},
                {cmn, none, "x", "", ""}};
    for (const auto& row : rows) {
        const auto put = [&](BT_CMN_logout output) {
            return outputs_of([&] { output(row.tag, row.format, row.argument); });
        };
        const Outputs console = put(_BT_CMN_logout_Console), file = put(_BT_CMN_logout_File),
                      both = put(_BT_CMN_logout_Console_And_File), stub = put(_BT_CMN_logout_Stub);
        expect_record(console.console, row.console);
        expect_record(file.file, row.file);
        expect_record(both.console, row.console);
        expect_record(both.file, row.file);
        EXPECT_EQ(both.console.substr(0, 24), both.file.substr(0, 24)) << "one timestamp for both";
        EXPECT_EQ(console.file + file.console + stub.console + stub.file, "");
        EXPECT_EQ(file.unflushed + both.unflushed, 0u);
    }
}

TEST_F(Log, LogFileIsOpenedOnceAndAgainOnlyAfterAReset)
{
    std::FILE* const stream = bt_cmn_log_fpget();
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(bt_cmn_log_fpget(), stream);
    EXPECT_NE(fcntl(fileno(stream), F_GETFD) & FD_CLOEXEC, 0);
    EXPECT_EQ(outputs_of([&] { std::fputs("kept\n", stream); }).file, "kept\n");
    bt_cmn_log_fp_reset();
    ASSERT_NE(bt_cmn_log_fpget(), nullptr);
    EXPECT_EQ(fake::read_file(kLogFile)->size(), 5u) << "appended to, never truncated";

    bt_cmn_log_fp_reset();
    const std::string folder = fake::root() + "/tmp", away = fake::root() + "/elsewhere";
    std::filesystem::rename(folder, away);
    EXPECT_EQ(bt_cmn_log_fpget(), nullptr);
    expect_record(outputs_of([] { _BT_CMN_logout_Console_And_File("CMN", "still"); }).console, "[CMN] still\n");
    std::filesystem::rename(away, folder);
    EXPECT_EQ(bt_cmn_log_fpget(), nullptr) << "no new attempt before a reset";
    bt_cmn_log_fp_reset();
    EXPECT_NE(bt_cmn_log_fpget(), nullptr);
}

TEST_F(Log, TimePrintWritesTheTimeOfDay)
{
    char text[64] = "";
    std::FILE* const file = fmemopen(text, sizeof text, "w");
    BT_CMN_DebugLogTimePrint(nullptr);
    BT_CMN_DebugLogTimePrint(file);
    std::fclose(file);
    const std::string record = outputs_of([] { _BT_CMN_logout_Console("CMN", "x"); }).console;
    expect_record(record.substr(0, 11) + text + "x", "x"); // the date is the record's
}

TEST_F(Log, DumpShowsSixteenBytesALine)
{
    const std::string full = "  4142 4344 4546 4748 494a 4b4c 4d4e 4f50   ABCDEFGH IJKLMNOP \n";
    const std::string one = "  41" + std::string(40, ' ') + "A" + std::string(17, ' ') + "\n";
    const std::string mixed = "  1f20 7e7f 80ff" + std::string(28, ' ') + ". ~..." + std::string(12, ' ') + "\n";
    Bytes data(5000), odd = fake::hex("1F 20 7E 7F 80 FF");
    for (size_t i = 0; i < data.size(); ++i)
        data[i] = static_cast<uint8_t>(0x41 + i % 16);
    const struct {
        const Bytes& data;
        int32_t size;
        size_t lines;
        const std::string &first, &last;
    } rows[] = {{data, 16, 1, full, full},     {data, 17, 2, full, one},      {odd, 6, 1, mixed, mixed},
                {data, 2048, 128, full, full}, {data, 2049, 128, full, full}, {data, INT32_MAX, 128, full, full}};
    select("@ConsoleLog=ON;\n@FileOutLog=ON;\n");
    for (const auto& row : rows) {
        fake::reset();
        const Outputs outputs = outputs_of([&] { BT_CMN_logdump("CMN", "title", row.data.data(), row.size); });
        const std::string header = "[CMN] <size=" + std::to_string(row.size) + "> : title\n";
        expect_record(outputs.console, header);
        std::string body;
        for (const std::string& line : zel(4))
            body += line;
        expect_record(outputs.file, header + body);
        EXPECT_EQ(outputs.unflushed, 0u);
        EXPECT_EQ(zel(4).size(), row.lines);
        EXPECT_EQ(zel(4).front(), row.first);
        EXPECT_EQ(zel(4).back(), row.last);
    }
}

TEST_F(Log, DumpGoesWhereTheFlagsSay)
{
    const uint8_t byte = 0x41;
    const std::string header = "[CMN] <size=1> : t\n",
                      record = header + "  41" + std::string(40, ' ') + "A" + std::string(17, ' ') + "\n";
    const std::string both = "@ConsoleLog=ON;\n@FileOutLog=ON;\n", file = "@FileOutLog=ON;\n",
                      console = "@ConsoleLog=ON;\n";
    const struct {
        const std::string& switches;
        const char *tag, *title;
        const uint8_t* data;
        int32_t size;
        std::string written;
    } rows[] = {{both, nullptr, "t", &byte, 1, ""},   {both, "CMN", nullptr, &byte, 1, ""},
                {both, "CMN", "t", nullptr, 1, ""},   {both, "CMN", "t", &byte, 0, ""},
                {both, "CMN", "t", &byte, -1, ""},    {"", "CMN", "t", &byte, 1, ""},
                {file, "CMN", "t", &byte, 1, record}, {console, "CMN", "t", &byte, 1, ""}};
    for (const auto& row : rows) {
        select(row.switches);
        const Outputs outputs = outputs_of([&] { BT_CMN_logdump(row.tag, row.title, row.data, row.size); });
        expect_record(outputs.console, row.switches == console ? header : "");
        expect_record(outputs.file, row.written);
        EXPECT_EQ(zel(4).size(), row.switches == console ? 1u : 0u);
    }

    fake::remove_file("/tmp"); // a file wanted, but none to have: the dump ends behind its console header
    select(both);
    expect_record(outputs_of([&] { BT_CMN_logdump("CMN", "t", &byte, 1); }).console, header);
    EXPECT_EQ(zel(4).size(), 1u);
    std::filesystem::create_directories(fake::root() + "/tmp");
}

} // namespace
