// Debug switches and the export of the logs: the files they leave behind.
#include "fake_platform.h"

#include <bt_service/bt_system.h>
#include <gtest/gtest.h>

#include <filesystem>

namespace {

using fake::Bytes;
namespace fs = std::filesystem;

const std::string kFolder = "/fs/rwdata/BT/btstack";
const std::string kService = kFolder + "/BT_SERVICE_DEBUG", kStack = kFolder + "/BT_STACK_DEBUG";

// The content of a file; "none" when there is none.
std::string content(const std::string& unit_path)
{
    const auto bytes = fake::read_file(unit_path);
    return bytes ? std::string(bytes->begin(), bytes->end()) : "none";
}

void write(const std::string& unit_path, const std::string& text)
{
    fake::write_file(unit_path, Bytes(text.begin(), text.end()));
}

class SystemDebug : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        clean();
        fs::create_directories(fake::root() + kFolder);
        fs::create_directories(fake::root() + "/tmp");
    }
    void TearDown() override { clean(); }

    static void clean()
    {
        for (const char* const path : {"/fs", "/export", "/tmp/bt_cmn.log", "/tmp/bt_stk.log", "/tmp/osapi.log"})
            fake::remove_file(path);
    }

    // A folder below the root whose whole path has `length` characters.
    static std::string folder_of(size_t length)
    {
        const std::string base = fake::root() + "/export/";
        std::string path = base + std::string(length - base.size(), 'x');
        fs::create_directories(path);
        EXPECT_EQ(path.size(), length);
        return path;
    }

    static int32_t enable(const std::string& flags)
    {
        const Bytes bytes = fake::hex(flags);
        uint8_t* const given = fake::guarded(36);
        EXPECT_EQ(bytes.size(), 36u);
        std::copy(bytes.begin(), bytes.end(), given);
        return BT_SRV_requestDebugEnable(static_cast<const uint32_t*>(static_cast<const void*>(given)));
    }
};

TEST_F(SystemDebug, EnableWritesOneLineForEachFlagThatIsOne)
{
    struct {
        std::string flags, service, stack;
    } const rows[] = {
        {"00000000*9", "", ""},
        {"01000000*9", "@ConsoleLog=ON;\n@FileOutLog=ON;\n@ConsoleSRVLog=ON;\n@StrmLog=ON;\n",
         "@AirLog=ON;\n@ConsoleLog=ON;\n@FileOutLog=ON;\n@ConsoleSTKLog=ON;\n@OsApiLog=ON;\n"},
        {"01000000 00000000*8", "@ConsoleLog=ON;\n", ""},
        {"00000000 01000000 00000000*7", "@FileOutLog=ON;\n", ""},
        {"00000000*2 01000000 00000000*6", "@ConsoleSRVLog=ON;\n", ""},
        {"00000000*3 01000000 00000000*5", "@StrmLog=ON;\n", ""},
        {"00000000*4 01000000 00000000*4", "", "@AirLog=ON;\n"},
        {"00000000*5 01000000 00000000*3", "", "@ConsoleLog=ON;\n"},
        {"00000000*6 01000000 00000000*2", "", "@FileOutLog=ON;\n"},
        {"00000000*7 01000000 00000000", "", "@ConsoleSTKLog=ON;\n"},
        {"00000000*8 01000000", "", "@OsApiLog=ON;\n"},
        {"02000000 FFFFFFFF 01010000 00000001 00000000*5", "", ""},
        {"00000000*4 03000000 01000001 FFFFFFFF 00010000 01000080", "", ""},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(enable(row.flags), 0) << row.flags;
        EXPECT_EQ(content(kService), row.service) << row.flags;
        EXPECT_EQ(content(kStack), row.stack) << row.flags;
        write(kService, "@Old=ON;\n"); // for the next row; the first one finds no files
        write(kStack, "@Old=ON;\n");
    }
}

TEST_F(SystemDebug, FilesThatCannotBeWrittenAreSkipped)
{
    write(kService + "/in/the/way", ""); // neither removed nor opened
    EXPECT_EQ(enable("01000000*9"), 0);
    EXPECT_TRUE(fs::is_directory(fake::root() + kService));
    EXPECT_NE(content(kStack).find("@OsApiLog=ON;\n"), std::string::npos);

    fake::remove_file("/fs");
    EXPECT_EQ(enable("01000000*9"), 0);
    EXPECT_FALSE(fs::exists(fake::root() + "/fs"));
    EXPECT_EQ(BT_SRV_requestDebugDisable(), 0);
    EXPECT_EQ(fake::posts().size(), 3u) << "each is posted all the same";
}

TEST_F(SystemDebug, FilesChangeAlsoWhenThePostFails)
{
    fake::answer_send(-1);
    write(kService, "@Old=ON;\n");
    write(kStack, "@Old=ON;\n");
    EXPECT_EQ(BT_SRV_requestDebugEnable(nullptr), -1);
    EXPECT_EQ(content(kService) + content(kStack), "@Old=ON;\n@Old=ON;\n") << "a refused call changes nothing";
    EXPECT_EQ(enable("00000000*3 01000000*2 00000000*4"), -127);
    EXPECT_EQ(content(kService) + content(kStack), "@StrmLog=ON;\n@AirLog=ON;\n");
    EXPECT_EQ(BT_SRV_requestDebugDisable(), -127);
    EXPECT_EQ(content(kService) + content(kStack), "nonenone");
}

TEST_F(SystemDebug, ExportCopiesWhatFitsThePathAndRemovesTheSwitches)
{
    const struct {
        size_t length;
        int32_t result;
        const char* copied; // over what was there before
    } rows[] = {{100, 0, "+cmn+stk+os"},  {242, 0, "+cmn+stk+os"},   {243, 0, "+old+old+os"},  {244, 0, "+old+old+old"},
                {253, 0, "+old+old+old"}, {254, -1, "+old+old+old"}, {255, -1, "+old+old+old"}};
    for (const auto& row : rows) {
        write("/tmp/bt_cmn.log", "+cmn");
        write("/tmp/bt_stk.log", "+stk");
        write("/tmp/osapi.log", "+os");
        write(kService, "on");
        write(kStack, "on");
        const std::string folder = folder_of(row.length), inside = folder.substr(fake::root().size());
        for (const char* const name : {"/bt_cmn.log", "/bt_stk.log", "/osapi.log"})
            write(inside + name, "+old");

        EXPECT_EQ(BT_SRV_requestDebugOutput(folder.c_str()), row.result) << row.length;
        EXPECT_EQ(content(inside + "/bt_cmn.log") + content(inside + "/bt_stk.log") + content(inside + "/osapi.log"),
                  row.copied)
            << row.length;
        EXPECT_EQ(std::distance(fs::directory_iterator(folder), {}), 3) << "under no name that was cut";
        EXPECT_EQ(content(kService) + content(kStack), row.result == 0 ? "nonenone" : "onon") << row.length;
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
    EXPECT_EQ(BT_SRV_requestDebugOutput(folder.c_str()), 0);
    EXPECT_TRUE(fake::read_file(inside + "/bt_cmn.log") == log);
    EXPECT_EQ(content(inside + "/bt_stk.log"), "stays");
    EXPECT_EQ(content(inside + "/osapi.log"), "");

    EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + "/tmp").c_str()), 0);
    EXPECT_TRUE(fake::read_file("/tmp/bt_cmn.log") == log) << "in its place already";

    write(inside + "/new/bt_cmn.log/in/the/way", ""); // one destination that cannot be opened
    EXPECT_EQ(BT_SRV_requestDebugOutput((folder + "/new").c_str()), 0);
    EXPECT_EQ(content(inside + "/new/osapi.log"), "");
}

TEST_F(SystemDebug, ExportToNowhereChangesNothing)
{
    write("/tmp/bt_cmn.log", "cmn");
    write(kService, "on");
    write(kStack, "on");
    const std::string missing = fake::root() + "/export/missing";
    EXPECT_EQ(BT_SRV_requestDebugOutput(nullptr), -1);
    EXPECT_EQ(BT_SRV_requestDebugOutput(""), -1);
    EXPECT_EQ(BT_SRV_requestDebugOutput(missing.c_str()), -1);
    EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + "/" + std::string(5000, 'x')).c_str()), -1);
    EXPECT_FALSE(fs::exists(fake::root() + "/export"));
    EXPECT_EQ(content(kService) + content(kStack), "onon");

    write("/export/missing", "a file"); // there, so it is no error that nothing can be copied into it
    EXPECT_EQ(BT_SRV_requestDebugOutput(missing.c_str()), 0);
    EXPECT_EQ(content("/export/missing"), "a file");
    EXPECT_EQ(content(kService) + content(kStack), "nonenone");
    EXPECT_TRUE(fake::calls().empty());
}

} // namespace
