/**
 * @file
 * Named POSIX shared memory objects, held through a handle record of the caller.
 *
 * An object is shared, readable and writable, and has permission bits 0777 less the process's mask. It carries no lock:
 * the processes that share it coordinate by their own means. A handle is used by one thread at a time.
 */
#ifndef BT_SERVICE_BT_SHARED_MEMORY_H
#define BT_SERVICE_BT_SHARED_MEMORY_H

#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

/** A shared memory object; the caller fills in name and size. W is the size of a pointer. */
typedef struct shm_handle {
    const char* name;          /* 0      name of the object, beginning with "/"  */
    uint32_t size;             /* W      bytes of the object and of each mapping */
    int32_t fd;                /* W + 4  descriptor, set by BT_CMN_createShm()   */
    void* addr;                /* W + 8  the mapping; null means not mapped      */
} BtShmHandle;
BT_ASSERT_AT(BtShmHandle, size, sizeof(void*));
BT_ASSERT_AT(BtShmHandle, fd, sizeof(void*) + 4);
BT_ASSERT_AT(BtShmHandle, addr, sizeof(void*) + 8);

/**
 * Opens the object of the handle's name, creating it if there is none, gives it the handle's size and maps it.
 *
 * @return 0 created or opened, `fd` and `addr` are set; 1 null handle or name, or a system call failed, the handle is
 *         unchanged
 */
BT_API uint32_t BT_CMN_createShm(BtShmHandle* handle);

/**
 * Maps the object once more through the descriptor that BT_CMN_createShm() left in the handle.
 *
 * @return 0 mapped, `addr` is set; 1 null handle or no mapping
 */
BT_API uint32_t BT_CMN_openShm(BtShmHandle* handle);

/**
 * Closes the descriptor and ends the mapping; the object lives on. The handle keeps both values, so it is not to be
 * closed or destroyed again before it is created anew.
 *
 * @return 0 unmapped; 1 null handle, or not mapped, the descriptor being closed then
 */
BT_API uint32_t BT_CMN_closeShm(BtShmHandle* handle);

/**
 * Closes the descriptor, ends the mapping and removes the object's name. Its memory stays as long as a process has it
 * mapped.
 *
 * @return 0 removed, `addr` is null; 1 null handle or name, or not mapped, the descriptor being closed and the object
 *         left in place then
 */
BT_API uint32_t BT_CMN_destroyShm(BtShmHandle* handle);

BT_EXTERN_C_END

#endif
