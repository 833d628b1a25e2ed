/**
 * @file
 * What programs on a host add to the platform interface: domains, process numbers, shared data and inspection.
 *
 * Everything lives in a domain, a name taken from BT_PLATFORM_DOMAIN ("default" when unset; 1..32 characters of
 * A-Z a-z 0-9 _ -). Processes of two domains never see each other. A domain exists from bt_host_create_domain() until
 * bt_host_remove_domain(); without it every post fails with -1. A process reads the name when it first needs the domain,
 * and again after that domain was removed.
 *
 * Functions return 0 (or a count) on success and a negative value on failure; bt_host_error() then says what went
 * wrong, where, and how to mend it. All of them may be called by any number of threads at once.
 *
 * A child made by fork() keeps what its parent linked and the handles of its locks. It owns no process number, and runs
 * no timers; it may claim a number of its own.
 */
#ifndef BT_PLATFORM_HOST_H
#define BT_PLATFORM_HOST_H

#include <bt_platform/platform.h>

#ifdef __cplusplus
extern "C" {
#endif

enum {
    BT_HOST_ANY_PNO = 0, /**< for bt_host_claim_pno(): any free number of the range below */
    BT_HOST_FIRST_FREE_PNO = 0x4000,
    BT_HOST_LAST_FREE_PNO = 0x7FFF,
    BT_HOST_NAME_MAX = 64, /**< longest name of shared data and locks, terminating zero included */
    BT_HOST_TIMER_MAX = 64 /**< timers of a process that run at the same time */
};

/** Name of the domain in force; valid until the domain changes. */
BT_PLATFORM_API const char* bt_host_domain(void);

/** What the last failed call of this thread has to say; empty when none failed. Also set by failing _sys_ calls. */
BT_PLATFORM_API const char* bt_host_error(void);

/**
 * Creates the domain. Processes may do so at the same time: one gets 0, the others 1. Nothing that a process killed at it
 * left behind is in the way.
 *
 * @return 0 created; 1 it existed already; -1 failure
 */
BT_PLATFORM_API int32_t bt_host_create_domain(void);

/**
 * Removes the domain and every object in it, also one that cannot be used any more.
 *
 * Processes that still use it keep their mappings; their posts and receives return -1, waiting ones at once.
 *
 * @return 0 removed; -1 there is none, or it belongs to another user
 */
BT_PLATFORM_API int32_t bt_host_remove_domain(void);

/**
 * Makes the calling process the owner of a process number; _sys_GetPno() returns it from then on. Messages that wait
 * there from an owner that died are kept. A process owns one number at most; BT_PLATFORM_PNO in the environment gives
 * one to a program that does not call this.
 *
 * The number ends with the process, also when it is killed, and with bt_host_release_pno(). After a kill its queue stays:
 * posts are accepted until it is full, and the next owner finds them. BT_HOST_ANY_PNO gives the lowest number that no live
 * process owns, with an empty queue.
 *
 * @param pno  the number, or BT_HOST_ANY_PNO
 * @return 0 owned, also when the process owned it already; 1 a live process owns it; -1 failure, also when the process
 *         owns another number
 */
BT_PLATFORM_API int32_t bt_host_claim_pno(uint32_t pno);

/**
 * Gives the number back and drops its queue: posts to it return 1 again. Stops the process's timers, ends waiting receives
 * with -1 and closes the descriptor of bt_host_receive_fd().
 *
 * @return 0; -1 when none is owned
 */
BT_PLATFORM_API int32_t bt_host_release_pno(void);

/**
 * As _sys_RcvMsg(), with a time limit.
 *
 * @param timeout_ms  0 does not wait, negative waits without limit
 * @return 1 a message; 0 none in time, or a signal; -1 the layer is unusable or no number is owned
 */
BT_PLATFORM_API int32_t bt_host_receive(void* buffer, uint32_t size, int32_t timeout_ms);

/**
 * A descriptor that polls readable while messages wait, for programs with their own loop.
 *
 * The layer owns it: never read or close it. After it turned readable call bt_host_receive() with 0 until that returns 0;
 * -1 then says that the domain was removed. A thread of the layer keeps it up from the first call on.
 *
 * @return the descriptor, the same for every call while the number is owned; -1 failure
 */
BT_PLATFORM_API int32_t bt_host_receive_fd(void);

/**
 * Creates zero-filled shared data.
 *
 * @param name  1 to 63 characters of any kind
 * @param size  bytes, not 0
 * @return 0 created; 1 it exists with that size, content kept; -1 failure, also when it exists with another size
 */
BT_PLATFORM_API int32_t bt_host_create_data(const char* name, uint32_t size);

/** Removes shared data. Links made before stay valid; the next link looks for it anew. @return 0, -1 when there is none */
BT_PLATFORM_API int32_t bt_host_remove_data(const char* name);

/** A process number and its queue. */
typedef struct BtHostQueue {
    uint32_t pno;
    uint32_t owner_pid; /**< 0 when the owner is gone */
    uint32_t queued; /**< messages that wait */
    uint32_t capacity;
    uint64_t posted; /**< messages accepted so far */
    uint64_t refused; /**< posts refused because the queue was full */
} BtHostQueue;

/** A named lock. */
typedef struct BtHostLock {
    char name[BT_HOST_NAME_MAX];
    uint32_t holder_pid; /**< 0 when free */
    uint32_t recovered; /**< times it was handed on from a dead holder */
} BtHostLock;

/** Named shared data. */
typedef struct BtHostData {
    char name[BT_HOST_NAME_MAX];
    uint32_t size;
} BtHostData;

/** Lists what the domain holds, at most `maximum` records. Changes nothing. @return number of records, -1 failure */
BT_PLATFORM_API int32_t bt_host_list_queues(BtHostQueue* out, int32_t maximum);
BT_PLATFORM_API int32_t bt_host_list_locks(BtHostLock* out, int32_t maximum);
BT_PLATFORM_API int32_t bt_host_list_data(BtHostData* out, int32_t maximum);

#ifdef __cplusplus
}
#endif
#endif
