#include "error.h"

#include <bt_platform/host.h>

#include <cstdarg>
#include <cstdio>

namespace bt::platform {
namespace {

thread_local char t_error[512];

} // namespace

int32_t fail(int32_t result, const char* format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(t_error, sizeof t_error, format, arguments);
    va_end(arguments);
    return result;
}

const char* last_error()
{
    return t_error;
}

} // namespace bt::platform

const char* bt_host_error()
{
    return bt::platform::last_error();
}
