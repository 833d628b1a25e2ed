// The logger, and how a process ends.
#include "platform_fixture.h"

#include <bt_service/bt_log.h>

#include <array>
#include <regex>
#include <sstream>
#include <thread>

namespace bt::test {
namespace {

using PlatformLogger = EmptyDomain;

// What `body` writes to stderr, in a process that has chosen no output before.
std::string stderr_of(const char* output, const std::function<void()>& body, int exit_code = 0)
{
    Capture errors;
    Child child([&] {
        errors.take(STDERR_FILENO);
        unsetenv("BT_PLATFORM_LOG");
        if (output != nullptr) setenv("BT_PLATFORM_LOG", output, 1);
        body();
    });
    const std::string text = errors.text();
    EXPECT_EQ(child.end(), exit_code);
    return text;
}

void log_some()
{
    QvLogSetProcessName("unit");
    QvLogSetZones(3, 11, 13, 200);
    QvLog(137, 11, "CMN", "zone %s\n", "eleven");
    QvLog(137, 12, "CMN", "zone twelve");
    QvLog(137, 200, "CMN", "zone two hundred\n\n");
    QvLog(137, 256, "CMN", "no zone");
    QvLog(137, UINT32_MAX, "CMN", "no zone");
    ZelLog(4, 77, "function", "failed: %d", -3);
}

TEST_F(PlatformLogger, RecordsGoWhereTheEnvironmentSays)
{
    for (const char* nowhere : {static_cast<const char*>(nullptr), "off", "nonsense"})
        EXPECT_EQ(stderr_of(nowhere, log_some), "");
    const std::string head = R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3} unit\[\d+\] )";
    const std::regex expected(head + "137/Function CMN: zone eleven\n" + head + "137/zone 200 CMN: zone two hundred\n" +
                              head + "level 4 function:77: failed: -3\n");
    const std::string text = stderr_of("stderr", log_some);
    EXPECT_TRUE(std::regex_match(text, expected)) << text;
}

TEST_F(PlatformLogger, ZonesAreKeptInTheLibrarysBlock)
{
    const auto expect_words = [](const std::array<uint32_t, 8>& expected) {
        EXPECT_EQ(std::memcmp(reinterpret_cast<const uint8_t*>(&g_VexLogParams) + 12052, expected.data(), 32), 0);
    };
    QvLogSetZones(4, 0, 31, 32, 255);
    expect_words({0x80000001, 1, 0, 0, 0, 0, 0, 0x80000000});
    QvLogSetZones(-1);
    expect_words({});
}

TEST_F(PlatformLogger, LinesOfThreadsDoNotMixAndLongOnesAreCut)
{
    constexpr int kLines = 300;
    std::istringstream lines(stderr_of("stderr", [] {
        std::thread threads[4];
        for (size_t at = 0; at < 4; ++at) {
            threads[at] = std::thread([body = std::string(400 + 300 * at, static_cast<char>('a' + at))] {
                for (int line = 0; line < kLines; ++line)
                    ZelLog(1, line, "f", "<%s", body.c_str());
            });
        }
        for (std::thread& thread : threads)
            thread.join();
    }));
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count) {
        const size_t start = line.find('<');
        ASSERT_NE(start, std::string::npos) << line;
        ASSERT_EQ(line.find_first_not_of(line[start + 1], start + 1), std::string::npos) << line;
        ASSERT_LE(line.size(), 1300U);
    }
    EXPECT_EQ(count, 4 * kLines);
}

TEST_F(PlatformLogger, ProcessThatEndsForTheLayerSaysWhy)
{
    const auto end = [] {
        EXPECT_EQ(post(Numbered()), -1);
        _sys_Exit(-1);
    };
    const std::string why = "there is no domain \"" + name + "\"";
    EXPECT_NE(stderr_of(nullptr, end, 255).find(why), std::string::npos);
    EXPECT_EQ(stderr_of("off", end, 255), "");
    EXPECT_EQ(stderr_of(
                  nullptr, [] { _sys_Exit(3); }, 3),
              "");
}

} // namespace
} // namespace bt::test
