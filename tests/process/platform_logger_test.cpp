// The logger, and how a process ends.
#include "platform_fixture.h"

#include <bt_service/bt_log.h>

#include <regex>
#include <sstream>
#include <thread>

namespace platform_test {
namespace {

using PlatformLogger = EmptyDomain;

// What `body` writes to stderr, in a process that has chosen no output before.
std::string stderr_of(const char* output, const std::function<void()>& body, int* exit_code = nullptr)
{
    int ends[2];
    if (pipe(ends) != 0) std::abort();
    Child child([&] {
        dup2(ends[1], STDERR_FILENO);
        close(ends[1]);
        unsetenv("BT_PLATFORM_LOG");
        if (output != nullptr) setenv("BT_PLATFORM_LOG", output, 1);
        body();
    });
    close(ends[1]);
    std::string text;
    char part[4096];
    for (ssize_t got = 0; (got = read(ends[0], part, sizeof part)) > 0;)
        text.append(part, static_cast<size_t>(got));
    close(ends[0]);
    const int code = child.exit_code();
    if (exit_code != nullptr) *exit_code = code;
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
    EXPECT_EQ(stderr_of(nullptr, log_some), "");
    EXPECT_EQ(stderr_of("off", log_some), "");
    EXPECT_EQ(stderr_of("nonsense", log_some), "");
    const std::string text = stderr_of("stderr", log_some);
    const std::string head = R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3} unit\[\d+\] )";
    EXPECT_TRUE(std::regex_match(text, std::regex(head + "137/Function CMN: zone eleven\n" + head +
                                                  "137/zone 200 CMN: zone two hundred\n" + head +
                                                  "level 4 function:77: failed: -3\n")))
        << text;
}

TEST_F(PlatformLogger, ZonesAreKeptInTheLibrarysBlock)
{
    QvLogSetZones(4, 0, 31, 32, 255);
    const auto read_words = [](uint32_t(&words)[8]) {
        std::memcpy(words, reinterpret_cast<const uint8_t*>(&g_VexLogParams) + 12052, sizeof words);
    };
    uint32_t words[8];
    read_words(words);
    const uint32_t expected[8] = {0x80000001, 1, 0, 0, 0, 0, 0, 0x80000000};
    EXPECT_EQ(std::memcmp(words, expected, sizeof words), 0);
    QvLogSetZones(-1);
    read_words(words);
    EXPECT_EQ(words[0], 0U);
}

TEST_F(PlatformLogger, LinesOfThreadsDoNotMixAndLongOnesAreCut)
{
    constexpr int kThreads = 4;
    constexpr int kLines = 300;
    const std::string text = stderr_of("stderr", [] {
        std::thread threads[kThreads];
        for (int at = 0; at < kThreads; ++at) {
            threads[at] = std::thread([at] {
                const std::string body(static_cast<size_t>(400 + 300 * at), static_cast<char>('a' + at));
                for (int line = 0; line < kLines; ++line)
                    ZelLog(1, line, "f", "<%s", body.c_str());
            });
        }
        for (std::thread& thread : threads)
            thread.join();
    });
    std::istringstream lines(text);
    std::string line;
    int count = 0;
    while (std::getline(lines, line)) {
        const size_t start = line.find('<');
        ASSERT_NE(start, std::string::npos) << line;
        ASSERT_EQ(line.find_first_not_of(line[start + 1], start + 1), std::string::npos) << line;
        ASSERT_LE(line.size(), 1300U);
        ++count;
    }
    EXPECT_EQ(count, kThreads * kLines);
}

TEST_F(PlatformLogger, ProcessThatEndsForTheLayerSaysWhy)
{
    const auto end = [] {
        EXPECT_EQ(post(Numbered()), -1);
        _sys_Exit(-1);
    };
    int code = 0;
    EXPECT_NE(stderr_of(nullptr, end, &code).find("there is no domain \"" + name + "\""), std::string::npos);
    EXPECT_EQ(code, 255);
    EXPECT_EQ(stderr_of("off", end, &code), "");
    EXPECT_EQ(code, 255);
    EXPECT_EQ(stderr_of(
                  nullptr, [] { _sys_Exit(3); }, &code),
              "");
    EXPECT_EQ(code, 3);
}

} // namespace
} // namespace platform_test
