/**
 * @file
 * The per-process handle by which a shared area is reached together with the lock that guards it.
 */
#ifndef BT_SERVICE_BT_SHARE_HANDLE_H
#define BT_SERVICE_BT_SHARE_HANDLE_H

#include <bt_service/bt_types.h>

/**
 * A shared area and its lock. All zero until first use; each field is filled in once, by the first thread that
 * succeeds, and then stays for the life of the process. It lives in the process only, so it may hold a pointer.
 */
struct share_handle {
    uint32_t semaphore;        /*  handle of the lock; 0 not created yet              */
    void *area;                /*  where the area is linked; null not linked yet      */
};
typedef struct share_handle BtShareHandle;
BT_ASSERT(sizeof(BtShareHandle) == 2 * sizeof(void *), BtShareHandle_size);
BT_ASSERT_AT(BtShareHandle, area, sizeof(void *));

#endif
