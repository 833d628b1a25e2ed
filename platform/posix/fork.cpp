// A child starts with the parent's mappings, lock handles and data, but with no process number, no timers and no
// pollable descriptor: those, and the threads behind them, are the parent's.
#include "fork.h"

#include "domain.h"
#include "logger.h"
#include "number.h"
#include "receive_fd.h"
#include "timers.h"

#include <pthread.h>
#include <unistd.h>

#include <atomic>

namespace bt::platform {
namespace {

std::atomic<uint32_t> g_pid{0};
pthread_once_t g_once = PTHREAD_ONCE_INIT;

void before()
{
    domain_before_fork();
    timers_before_fork();
    number_before_fork();
    receive_fd_before_fork();
    logger_before_fork();
}

void after_in_parent()
{
    logger_after_fork();
    receive_fd_after_fork_in_parent();
    number_after_fork_in_parent();
    timers_after_fork_in_parent();
    domain_after_fork();
}

void after_in_child()
{
    g_pid.store(static_cast<uint32_t>(getpid()));
    logger_after_fork();
    receive_fd_after_fork_in_child();
    number_after_fork_in_child();
    timers_after_fork_in_child();
    domain_after_fork();
}

void set_up()
{
    g_pid.store(static_cast<uint32_t>(getpid()));
    pthread_atfork(before, after_in_parent, after_in_child);
}

} // namespace

void set_up_fork_handlers()
{
    pthread_once(&g_once, set_up);
}

uint32_t own_pid()
{
    return g_pid.load(std::memory_order_relaxed);
}

} // namespace bt::platform
