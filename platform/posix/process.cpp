// Set-up and end of the process.
#include "domain.h"
#include "error.h"
#include "logger.h"

#include <bt_platform/platform.h>

#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>

namespace bt::platform {
namespace {

std::atomic<bool> g_ending{false};
thread_local bool t_ending = false;

// exit() is for one thread, once: others wait for the end it brings, and a handler that it runs ends here at once.
void enter_exit_once(int32_t code)
{
    if (t_ending) std::_Exit(code);
    while (g_ending.exchange(true))
        pause();
    t_ending = true;
}

} // namespace
} // namespace bt::platform

using namespace bt::platform;

int32_t _sys_SetupZX44API(uint32_t)
{
    domain();
    return 0;
}

void _sys_Exit(int32_t code)
{
    enter_exit_once(code);
    if (code == -1 && last_error()[0] != '\0') {
        char text[600];
        std::snprintf(text, sizeof text, "the process ends with %d: %s", code, last_error());
        log_last_words(text);
    }
    std::exit(code);
}
