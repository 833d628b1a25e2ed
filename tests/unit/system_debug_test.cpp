// Debug switches and the export of the logs: the files they leave behind.
#include "fake_platform.h"

#include <bt_service/bt_system.h>
#include <gtest/gtest.h>

#include <filesystem>

namespace {

using fake::Bytes;
namespace fs = std::filesystem;

const std::string kService = "/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG", kStack = "/fs/rwdata/BT/btstack/BT_STACK_DEBUG";

// The content of a file; "none" when there is none.
std::string content(const std::string& unit_path)
{
    const auto bytes = fake::read_file(unit_path);
    return bytes ? std::string(bytes->begin(), bytes->end()) : "none";
}

std::string switches()
{
    return content(kService) + "|" + content(kStack);
}

void write(const std::string& unit_path, const std::string& text)
{
    fake::write_file(unit_path, Bytes(text.begin(), text.end()));
}

void write_switches()
{
    write(kService, "@Old=ON;\n");
    write(kStack, "@Old=ON;\n");
}

// A folder below the root whose whole path has `length` characters.
std::string folder_of(size_t length)
{
    const std::string base = fake::root() + "/export/";
    const std::string path = base + std::string(length - base.size(), 'x');
    fs::create_directories(path);
    return path;
}

int32_t enable(const std::string& flags)
{
    const Bytes bytes = fake::hex(flags);
    uint8_t* const given = fake::guarded(36);
    EXPECT_EQ(bytes.size(), 36u);
    std::copy(bytes.begin(), bytes.end(), given);
    return BT_SRV_requestDebugEnable(static_cast<const uint32_t*>(static_cast<const void*>(given)));
}

int32_t export_to(const std::string& folder)
{
    return BT_SRV_requestDebugOutput(folder.c_str());
}

class SystemDebug : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        TearDown();
        fs::create_directories(fake::root() + "/fs/rwdata/BT/btstack");
        fs::create_directories(fake::root() + "/tmp");
    }
    void TearDown() override
    {
        for (const char* const path : {"/fs", "/export", "/tmp/bt_cmn.log", "/tmp/bt_stk.log", "/tmp/osapi.log"})
            fake::remove_file(path);
    }
};

TEST_F(SystemDebug, EnableWritesOneLineForEachFlagThatIsOne)
{
    const std::pair<const char*, const char*> rows[] = {
        {"00000000*9", "|"},
        {"01000000*9", "@ConsoleLog=ON;\n@FileOutLog=ON;\n@ConsoleSRVLog=ON;\n@StrmLog=ON;\n|"
                       "@AirLog=ON;\n@ConsoleLog=ON;\n@FileOutLog=ON;\n@ConsoleSTKLog=ON;\n@OsApiLog=ON;\n"},
        {"01000000 00000000*8", "@ConsoleLog=ON;\n|"},
        {"00000000 01000000 00000000*7", "@FileOutLog=ON;\n|"},
        {"00000000*2 01000000 00000000*6", "@ConsoleSRVLog=ON;\n|"},
        {"00000000*3 01000000 00000000*5", "@StrmLog=ON;\n|"},
        {"00000000*4 01000000 00000000*4", "|@AirLog=ON;\n"},
        {"00000000*5 01000000 00000000*3", "|@ConsoleLog=ON;\n"},
        {"00000000*6 01000000 00000000*2", "|@FileOutLog=ON;\n"},
        {"00000000*7 01000000 00000000", "|@ConsoleSTKLog=ON;\n"},
        {"00000000*8 01000000", "|@OsApiLog=ON;\n"},
        {"02000000 FFFFFFFF 01010000 00000001 03000000 01000001 FFFFFFFF 00010000 01000080", "|"},
    };
    for (const auto& [flags, written] : rows) {
        EXPECT_EQ(enable(flags), 0) << flags;
        EXPECT_EQ(switches(), written) << flags;
        write_switches(); // for the next row; the first one finds no files
    }
}

TEST_F(SystemDebug, FilesThatCannotBeWrittenAreSkipped)
{
    write(kService + "/in/the/way", ""); // neither removed nor opened
    EXPECT_EQ(enable("01000000*9"), 0);
    EXPECT_NE(content(kStack).find("@OsApiLog=ON;\n"), std::string::npos);
    fake::remove_file("/fs");
    EXPECT_EQ(enable("01000000*9"), 0);
    EXPECT_EQ(BT_SRV_requestDebugDisable(), 0);
    EXPECT_EQ(fake::posts().size(), 3u) << "each is posted all the same";
}

TEST_F(SystemDebug, FilesChangeAlsoWhenThePostFails)
{
    fake::answer_send(-1);
    write_switches();
    EXPECT_EQ(BT_SRV_requestDebugEnable(nullptr), -1);
    EXPECT_EQ(switches(), "@Old=ON;\n|@Old=ON;\n") << "a refused call changes nothing";
    EXPECT_EQ(enable("00000000*3 01000000*2 00000000*4"), -127);
    EXPECT_EQ(switches(), "@StrmLog=ON;\n|@AirLog=ON;\n");
    EXPECT_EQ(BT_SRV_requestDebugDisable(), -127);
    EXPECT_EQ(switches(), "none|none");
}

TEST_F(SystemDebug, ExportCopiesWhatFitsThePathAndRemovesTheSwitches)
{
    const struct {
        size_t length;
        int32_t result;
        const char* copied; // over what was there before
    } rows[] = {{242, 0, "+cmn+stk+os"},
                {243, 0, "+old+old+os"},
                {244, 0, "+old+old+old"},
                {253, 0, "+old+old+old"},
                {254, -1, "+old+old+old"}};
    for (const auto& row : rows) {
        write("/tmp/bt_cmn.log", "+cmn");
        write("/tmp/bt_stk.log", "+stk");
        write("/tmp/osapi.log", "+os");
        write_switches();
        const std::string folder = folder_of(row.length), inside = folder.substr(fake::root().size());
        for (const char* const name : {"/bt_cmn.log", "/bt_stk.log", "/osapi.log"})
            write(inside + name, "+old");

        EXPECT_EQ(export_to(folder), row.result) << row.length;
        EXPECT_EQ(content(inside + "/bt_cmn.log") + content(inside + "/bt_stk.log") + content(inside + "/osapi.log"),
                  row.copied)
            << row.length;
        EXPECT_EQ(std::distance(fs::directory_iterator(folder), {}), 3) << "under no name that was cut";
        EXPECT_EQ(switches(), row.result == 0 ? "none|none" : "@Old=ON;\n|@Old=ON;\n") << row.length;
        EXPECT_EQ(content("/tmp/bt_cmn.log"), "+cmn");
    }
    EXPECT_TRUE(fake::calls().empty()) << "nothing is posted";
}

TEST_F(SystemDebug, ExportCopiesEveryByteAndSkipsMissingLogs)
{
    Bytes log(70000);
    for (size_t i = 0; i < log.size(); ++i)
        log[i] = static_cast<uint8_t>(i * 31 + i / 256);
    fake::write_file("/tmp/bt_cmn.log", log);
    fake::write_file("/tmp/osapi.log", {});
    const std::string folder = folder_of(120), inside = folder.substr(fake::root().size());
    write(inside + "/bt_cmn.log", std::string(90000, 'x')); // longer than what replaces it
    write(inside + "/bt_stk.log", "stays");
    EXPECT_EQ(export_to(folder), 0);
    EXPECT_TRUE(fake::read_file(inside + "/bt_cmn.log") == log);
    EXPECT_EQ(content(inside + "/bt_stk.log"), "stays");
    EXPECT_EQ(content(inside + "/osapi.log"), "");

    EXPECT_EQ(export_to(fake::root() + "/tmp"), 0);
    EXPECT_TRUE(fake::read_file("/tmp/bt_cmn.log") == log) << "in its place already";

    write(inside + "/new/bt_cmn.log/in/the/way", ""); // one destination that cannot be opened
    EXPECT_EQ(export_to(folder + "/new"), 0);
    EXPECT_EQ(content(inside + "/new/osapi.log"), "");
}

TEST_F(SystemDebug, ExportToNowhereChangesNothing)
{
    write("/tmp/bt_cmn.log", "cmn");
    write_switches();
    EXPECT_EQ(BT_SRV_requestDebugOutput(nullptr), -1);
    for (const std::string& missing : {std::string(), fake::root() + "/export", "/" + std::string(5000, 'x')})
        EXPECT_EQ(export_to(missing), -1) << missing;
    EXPECT_FALSE(fs::exists(fake::root() + "/export"));
    EXPECT_EQ(switches(), "@Old=ON;\n|@Old=ON;\n");

    write("/export", "a file"); // there, so it is no error that nothing can be copied into it
    EXPECT_EQ(export_to(fake::root() + "/export"), 0);
    EXPECT_EQ(content("/export"), "a file");
    EXPECT_EQ(switches(), "none|none");
}

} // namespace
