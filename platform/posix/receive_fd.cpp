// A thread sleeps on the queue in the program's place and keeps one byte in a pipe while messages wait, so senders need
// to know nothing of it.
#include "receive_fd.h"

#include "background.h"
#include "clock.h"
#include "domain.h"
#include "error.h"
#include "number.h"

#include <bt_platform/host.h>

#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace bt::platform {
namespace {

pthread_mutex_t g_lock = PTHREAD_MUTEX_INITIALIZER; // of everything below
pthread_cond_t g_changed = PTHREAD_COND_INITIALIZER;
std::atomic<bool> g_open{false};
bool g_raised = false;
bool g_stop = false;
int g_pipe[2] = {-1, -1};
pthread_t g_thread;

// Returns once the byte is taken out again, or at the end.
void raise_and_wait(const Ring& ring)
{
    pthread_mutex_lock(&g_lock);
    const bool closed = ring.owned.load() == 0; // the program has to notice that, too
    if (!g_stop && (closed || waiting(ring) != 0)) {
        g_raised = write(g_pipe[1], "", 1) == 1;
        while (g_raised && !g_stop)
            pthread_cond_wait(&g_changed, &g_lock);
    }
    pthread_mutex_unlock(&g_lock);
}

bool stopped()
{
    pthread_mutex_lock(&g_lock);
    const bool stop = g_stop;
    pthread_mutex_unlock(&g_lock);
    return stop;
}

void* watch(void* argument)
{
    Ring& ring = *static_cast<Ring*>(argument);
    while (!stopped()) {
        if (ring.owned.load() == 0 || waiting(ring) != 0) {
            raise_and_wait(ring);
        } else {
            sleep_on(ring, 1000 * kMillisecond);
        }
    }
    return nullptr;
}

bool open_pipe()
{
    if (pipe(g_pipe) != 0) return false;
    for (const int fd : g_pipe) {
        fcntl(fd, F_SETFD, FD_CLOEXEC);
        fcntl(fd, F_SETFL, O_NONBLOCK);
    }
    return true;
}

void close_pipe()
{
    for (int& fd : g_pipe) {
        close(fd);
        fd = -1;
    }
}

} // namespace

void settle_receive_fd(Ring& ring)
{
    if (!g_open.load(std::memory_order_acquire) || waiting(ring) != 0) return;

    pthread_mutex_lock(&g_lock);
    char byte = 0;
    if (g_raised && waiting(ring) == 0 && read(g_pipe[0], &byte, 1) == 1) {
        g_raised = false;
        pthread_cond_signal(&g_changed);
    }
    pthread_mutex_unlock(&g_lock);
}

void close_receive_fd()
{
    if (!g_open.load()) return;

    pthread_mutex_lock(&g_lock);
    g_stop = true;
    pthread_cond_signal(&g_changed);
    pthread_mutex_unlock(&g_lock);
    pthread_join(g_thread, nullptr);

    pthread_mutex_lock(&g_lock);
    g_open.store(false);
    g_raised = false;
    close_pipe();
    pthread_mutex_unlock(&g_lock);
}

void receive_fd_before_fork()
{
    pthread_mutex_lock(&g_lock);
}

void receive_fd_after_fork_in_parent()
{
    pthread_mutex_unlock(&g_lock);
}

void receive_fd_after_fork_in_child()
{
    if (g_open.load()) close_pipe();
    g_open.store(false);
    g_raised = false;
    pthread_cond_init(&g_changed, nullptr); // the parent's thread may stand in it
    pthread_mutex_unlock(&g_lock);
}

} // namespace bt::platform

using namespace bt::platform;

int32_t bt_host_receive_fd()
{
    if (own_number() == 0) return fail(-1, "the process owns no process number; claim one or set BT_PLATFORM_PNO");

    const ProcessLock lock;
    if (g_open.load()) return g_pipe[0];
    Ring* const ring = own_ring();
    if (ring == nullptr) return fail(-1, "the process owns no process number; claim one or set BT_PLATFORM_PNO");
    if (!open_pipe()) return fail(-1, "no pipe for the receive descriptor: %s", strerror(errno));

    g_stop = false;
    if (!start_thread(&g_thread, watch, ring)) {
        close_pipe();
        return fail(-1, "no thread for the receive descriptor: %s", strerror(errno));
    }
    g_open.store(true);
    return g_pipe[0];
}
