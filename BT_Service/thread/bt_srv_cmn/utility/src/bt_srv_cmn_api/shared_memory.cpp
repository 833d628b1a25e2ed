// Named POSIX shared memory objects.
#include "log_line.h"

#include <bt_service/bt_shared_memory.h>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/types.h>
#include <unistd.h>

namespace bt::cmn {
namespace {

constexpr mode_t kEverybody = 0777;

uint32_t refused(const char* function, int line)
{
    CMN_LOG(CMN_AT "param err. fd = %p ", kApiSource, function, line, static_cast<void*>(nullptr));
    return kFailure;
}

void* map(int descriptor, uint32_t size)
{
    return mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor, 0);
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

uint32_t BT_CMN_createShm(BtShmHandle* handle)
{
    CMN_LOG_START();
    if (handle == nullptr || handle->name == nullptr) return refused(__func__, __LINE__);

    const int descriptor = shm_open(handle->name, O_RDWR | O_CREAT, kEverybody);
    if (descriptor == -1) {
        CMN_LOG(CMN_AT "shm_open err. fd = %d ", CMN_API_PLACE, descriptor);
        return kFailure;
    }
    const int sized = ftruncate(descriptor, static_cast<off_t>(handle->size));
    if (sized != 0) {
        CMN_LOG(CMN_AT "ftruncate err. ret = %d ", CMN_API_PLACE, sized);
        close(descriptor);
        return kFailure;
    }
    void* const mapping = map(descriptor, handle->size);
    if (mapping == MAP_FAILED) {
        CMN_LOG(CMN_AT "mmap err. addr = %p ", CMN_API_PLACE, mapping);
        close(descriptor);
        return kFailure;
    }
    handle->fd = descriptor;
    handle->addr = mapping;
    CMN_LOG("[API][END] %s ", __func__);
    return kSuccess;
}

uint32_t BT_CMN_openShm(BtShmHandle* handle)
{
    CMN_LOG_START();
    if (handle == nullptr) return refused(__func__, __LINE__);

    void* const mapping = map(handle->fd, handle->size);
    if (mapping == MAP_FAILED) {
        CMN_LOG(CMN_AT "mmap err. addr = %p ", CMN_API_PLACE, mapping);
        return kFailure;
    }
    handle->addr = mapping;
    CMN_LOG("[API][END] %s ", __func__);
    return kSuccess;
}

uint32_t BT_CMN_closeShm(BtShmHandle* handle)
{
    if (handle == nullptr) return refused(__func__, __LINE__);

    close(handle->fd);
    if (handle->addr == nullptr) return refused(__func__, __LINE__);
    munmap(handle->addr, handle->size);
    return kSuccess;
}

uint32_t BT_CMN_destroyShm(BtShmHandle* handle)
{
    CMN_LOG_START();
    if (handle == nullptr || handle->name == nullptr) return refused(__func__, __LINE__);

    close(handle->fd);
    if (handle->addr == nullptr) return refused(__func__, __LINE__);
    munmap(handle->addr, handle->size);
    shm_unlink(handle->name);
    handle->addr = nullptr;
    CMN_LOG("[API][END] %s ", __func__);
    return kSuccess;
}
