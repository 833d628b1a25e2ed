// The service's log file: opened on first use, once, however many threads log at that moment.
#include <bt_service/bt_log.h>

#include "base/rooted_path.h"

#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#include <atomic>

namespace bt::cmn {
namespace {

constexpr char kLogFile[] = "/tmp/bt_cmn.log";

enum State : int32_t { kFailed = -1, kNotOpened = 0, kOpen = 1 };

std::atomic<int32_t> g_state{kNotOpened};
pthread_mutex_t g_opening = PTHREAD_MUTEX_INITIALIZER;
FILE* g_stream = nullptr; // written once; read after g_state says kOpen, or under g_opening

bool close_on_exec(int descriptor)
{
    return descriptor != -1 && fcntl(descriptor, F_SETFD, FD_CLOEXEC) != -1;
}

// The stream of an earlier selection gets the newly opened file put under it, which closes the old one: another thread
// may be writing a record to it at this moment.
bool adopt(FILE* opened)
{
    if (g_stream == nullptr) {
        g_stream = opened;
        return true;
    }
    const int descriptor = dup2(fileno(opened), fileno(g_stream));
    fclose(opened);
    return close_on_exec(descriptor);
}

bool open_log_file()
{
    FILE* const opened = fopen(RootedPath(kLogFile).c_str(), "a");
    if (opened == nullptr) return false;
    if (close_on_exec(fileno(opened))) return adopt(opened);

    fclose(opened);
    return false;
}

} // namespace
} // namespace bt::cmn

FILE* bt_cmn_log_fpget(void)
{
    using namespace bt::cmn;

    int32_t state = g_state.load(std::memory_order_acquire);
    if (state == kNotOpened) {
        pthread_mutex_lock(&g_opening);
        state = g_state.load(std::memory_order_relaxed);
        if (state == kNotOpened) {
            state = open_log_file() ? kOpen : kFailed;
            g_state.store(state, std::memory_order_release);
        }
        pthread_mutex_unlock(&g_opening);
    }
    return state == kOpen ? g_stream : nullptr;
}

void bt_cmn_log_fp_reset(void)
{
    using namespace bt::cmn;

    pthread_mutex_lock(&g_opening);
    g_state.store(kNotOpened, std::memory_order_release);
    pthread_mutex_unlock(&g_opening);
}
