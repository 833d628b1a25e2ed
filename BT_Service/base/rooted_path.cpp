#include "base/rooted_path.h"

#include <pthread.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

namespace bt {
namespace {

pthread_once_t g_root_read = PTHREAD_ONCE_INIT;
char g_root[768];
bool g_root_too_long = false;

void read_root()
{
    const bool set_user_id = getuid() != geteuid() || getgid() != getegid();
    const char* const root = std::getenv("BT_SERVICE_ROOT");
    if (set_user_id || root == nullptr) return;

    const int length = std::snprintf(g_root, sizeof g_root, "%s", root);
    g_root_too_long = length < 0 || static_cast<size_t>(length) >= sizeof g_root;
}

} // namespace

RootedPath::RootedPath(const char* absolute)
{
    pthread_once(&g_root_read, read_root);

    const int length = std::snprintf(text_, sizeof text_, "%s%s", g_root, absolute);
    if (g_root_too_long || length < 0 || static_cast<size_t>(length) >= sizeof text_) text_[0] = '\0';
}

} // namespace bt
