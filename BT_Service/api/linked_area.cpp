#include "api/linked_area.h"

#include <bt_platform/platform.h>

#include <pthread.h>

#include <algorithm>

namespace bt {
namespace {

pthread_mutex_t g_writing = PTHREAD_MUTEX_INITIALIZER;

} // namespace

LinkedArea::LinkedArea(const char* name, uint32_t size_needed, uint32_t size_if_unreported) : size_(size_needed)
{
    void* address = nullptr;
    if (_sys_LinkShareData(name, &address, &size_) == 0) start_ = static_cast<uint8_t*>(address);
    if (size_ == 0) size_ = size_if_unreported;
}

uint32_t LinkedArea::room(const ListLayout& list) const
{
    return std::min(list.capacity, (size_ - list.entries_at) / list.entry_size);
}

void LinkedArea::copy_entries(const ListLayout& list, uint32_t first, uint32_t count, void* to) const
{
    if (count == 0) return;
    std::memcpy(to, at(list.entries_at + first * list.entry_size), size_t{count} * list.entry_size);
}

AreaWriting::AreaWriting()
{
    pthread_mutex_lock(&g_writing);
}

AreaWriting::~AreaWriting()
{
    pthread_mutex_unlock(&g_writing);
}

} // namespace bt
