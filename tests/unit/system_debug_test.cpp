// Debug switches and the export of the logs: the files they leave behind.
#include "request_rows.h"

#include <bt_service/bt_system.h>

#include <filesystem>

namespace {

using requests::Given;
namespace fs = std::filesystem;

const std::string kService = "/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG", kStack = "/fs/rwdata/BT/btstack/BT_STACK_DEBUG";
const std::string kOld = "@Old=ON;\n";

void write(const std::string& unit_path, const std::string& text)
{
    fake::write_file(unit_path, fake::Bytes(text.begin(), text.end()));
}

// The contents of files; "none" for one that is not there.
std::string contents(std::initializer_list<std::string> unit_paths)
{
    std::string all;
    for (const std::string& path : unit_paths) {
        const auto bytes = fake::read_file(path);
        all += (bytes ? std::string(bytes->begin(), bytes->end()) : "none") + "|";
    }
    return all;
}

class SystemDebug : public testing::Test {
protected:
    void SetUp() override
    {
        TearDown();
        write(kService, kOld);
        write(kStack, kOld);
    }
    void TearDown() override
    {
        fake::reset();
        for (const char* const path : {"/fs", "/export", "/tmp/bt_cmn.log", "/tmp/bt_stk.log", "/tmp/osapi.log"})
            fake::remove_file(path);
    }
    static std::string switches() { return contents({kService, kStack}); }
};

TEST_F(SystemDebug, EnableWritesOneLineForEachFlagThatIsOne)
{
    const std::string keys[] = {"@ConsoleLog", "@FileOutLog", "@ConsoleSRVLog", "@StrmLog", "@AirLog",
                                "@ConsoleLog", "@FileOutLog", "@ConsoleSTKLog", "@OsApiLog"};
    std::string service, stack;
    for (size_t i = 0; i < 9; ++i) {
        const std::string line = keys[i] + "=ON;\n", zeros = " 00000000*";
        (i < 4 ? service : stack) += line;
        const Given flags(zeros + std::to_string(i) + " 01000000" + zeros + std::to_string(8 - i));
        EXPECT_EQ(BT_SRV_requestDebugEnable(flags), 0) << i;
        EXPECT_EQ(switches(), i < 4 ? line + "||" : "|" + line + "|") << i;
    }
    const Given all("01000000*9"), hostile("02000000 FFFFFFFF 01010000 00000001 03000000 01000001 00010000*2 01000080");
    EXPECT_EQ(BT_SRV_requestDebugEnable(hostile), 0);
    EXPECT_EQ(switches(), "||");
    EXPECT_EQ(BT_SRV_requestDebugEnable(all), 0);
    EXPECT_EQ(switches(), service + "|" + stack + "|");
    fake::remove_file(kService);
    write(kService + "/in/the/way", ""); // neither removed nor opened
    EXPECT_EQ(BT_SRV_requestDebugEnable(all), 0);
    EXPECT_EQ(contents({kStack}), stack + "|");
    fake::remove_file("/fs");
    EXPECT_EQ(BT_SRV_requestDebugEnable(all), 0);
    EXPECT_EQ(fake::posts().size(), 13u) << "each is posted all the same";
}

TEST_F(SystemDebug, FilesChangeAlsoWhenThePostFails)
{
    std::string at_post; // what the service finds
    fake::at_send([&] { at_post = switches(); });
    fake::answer_send(-1);
    EXPECT_EQ(BT_SRV_requestDebugEnable(nullptr), -1);
    EXPECT_EQ(switches(), kOld + "|" + kOld + "|") << "a refused call changes nothing";
    EXPECT_EQ(BT_SRV_requestDebugEnable(Given("00000000*3 01000000*2 00000000*4")), -127);
    EXPECT_EQ(switches(), "@StrmLog=ON;\n|@AirLog=ON;\n|");
    EXPECT_EQ(at_post, "@StrmLog=ON;\n|@AirLog=ON;\n|");
    EXPECT_EQ(BT_SRV_requestDebugDisable(), -127);
    EXPECT_EQ(switches(), "none|none|");
    EXPECT_EQ(at_post, "none|none|");
}

TEST_F(SystemDebug, ExportCopiesWhatFitsThePathAndRemovesTheSwitches)
{
    const struct {
        size_t length; // of the whole path of the folder
        int32_t result;
        const char* copied; // over what was there before
    } rows[] = {{242, 0, "+cmn|+stk|+os|"},
                {243, 0, "+old|+old|+os|"},
                {244, 0, "+old|+old|+old|"},
                {253, 0, "+old|+old|+old|"},
                {254, -1, "+old|+old|+old|"}};
    for (const auto& row : rows) {
        SetUp();
        const std::string inside = "/export/" + std::string(row.length - fake::root().size() - 8, 'x');
        for (const std::string folder : {"/tmp", inside.c_str()}) {
            write(folder + "/bt_cmn.log", folder == inside ? "+old" : "+cmn");
            write(folder + "/bt_stk.log", folder == inside ? "+old" : "+stk");
            write(folder + "/osapi.log", folder == inside ? "+old" : "+os");
        }
        EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + inside).c_str()), row.result) << row.length;
        EXPECT_EQ(contents({inside + "/bt_cmn.log", inside + "/bt_stk.log", inside + "/osapi.log"}), row.copied);
        EXPECT_EQ(std::distance(fs::directory_iterator(fake::root() + inside), {}), 3) << "under no name that was cut";
        EXPECT_EQ(switches(), row.result == 0 ? "none|none|" : kOld + "|" + kOld + "|") << row.length;
        EXPECT_TRUE(fake::calls().empty()) << "nothing is posted";
    }
}

TEST_F(SystemDebug, ExportCopiesEveryByteAndSkipsMissingLogs)
{
    std::string log(70000, '\0');
    for (size_t i = 0; i < log.size(); ++i)
        log[i] = static_cast<char>(i * 31 + i / 256);
    write("/tmp/bt_cmn.log", log);
    write("/tmp/osapi.log", "");
    write("/export/bt_cmn.log", std::string(90000, 'x')); // longer than what replaces it
    write("/export/bt_stk.log", "stays");
    EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + "/export").c_str()), 0);
    EXPECT_TRUE(contents({"/export/bt_cmn.log"}) == log + "|");
    EXPECT_EQ(contents({"/export/bt_stk.log", "/export/osapi.log"}), "stays||");
    write("/tmp/bt_stk.log/in/the/way", ""); // from now on one that opens and cannot be read

    EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + "/tmp").c_str()), 0);
    EXPECT_TRUE(contents({"/tmp/bt_cmn.log"}) == log + "|") << "in its place already";

    write("/export/new/bt_cmn.log/in/the/way", ""); // one destination that cannot be opened
    EXPECT_EQ(BT_SRV_requestDebugOutput((fake::root() + "/export/new").c_str()), 0);
    EXPECT_EQ(contents({"/export/new/bt_stk.log", "/export/new/osapi.log"}), "||");
}

TEST_F(SystemDebug, ExportToNowhereChangesNothing)
{
    const std::string missing = fake::root() + "/export", too_long = "/" + std::string(5000, 'x');
    write("/tmp/bt_cmn.log", "cmn");
    for (const char* const folder : {static_cast<const char*>(nullptr), "", missing.c_str(), too_long.c_str()})
        EXPECT_EQ(BT_SRV_requestDebugOutput(folder), -1);
    EXPECT_FALSE(fs::exists(missing));
    EXPECT_EQ(switches(), kOld + "|" + kOld + "|");

    write("/export", "a file"); // there, so it is no error that nothing can be copied into it
    EXPECT_EQ(BT_SRV_requestDebugOutput(missing.c_str()), 0);
    EXPECT_EQ(contents({"/export", kService, kStack}), "a file|none|none|");
}

} // namespace
