/**
 * @file
 * Events: registering for them, and posting them on the service's side.
 *
 * Listeners stand in one table in named shared memory, guarded by a named lock that dispatch takes too: the table never
 * changes while an event is posted. An event is a BtMessage whose cid is the event id.
 *
 * BT_EDS_initialize() has to run once, on the service's side, before anybody registers.
 */
#ifndef BT_SERVICE_BT_EVENTS_H
#define BT_SERVICE_BT_EVENTS_H

#include <bt_service/bt_message.h>
#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

enum { BT_EVT_LISTENERS_MAX = 50, BT_EVT_IDS_MAX = 35 };

/** A listener. */
typedef struct BtEvtListener {
    uint32_t handle;                    /*  0  handle of the registration; 0 marks a free entry */
    uint16_t pno;                       /*  4  process number of the listener                   */
    uint16_t reserved;                  /*  6  zero                                             */
    uint32_t tag;                       /*  8  as given at registration                         */
    uint32_t active;                    /* 12  1 events are wanted, 0 suspended                 */
    uint32_t event_count;               /* 16  0..35                                            */
    uint32_t event_ids[BT_EVT_IDS_MAX]; /* 20  the first event_count are valid                  */
} BtEvtListener;
BT_ASSERT_SIZE(BtEvtListener, 160);
BT_ASSERT_AT(BtEvtListener, handle, 0);
BT_ASSERT_AT(BtEvtListener, pno, 4);
BT_ASSERT_AT(BtEvtListener, reserved, 6);
BT_ASSERT_AT(BtEvtListener, tag, 8);
BT_ASSERT_AT(BtEvtListener, active, 12);
BT_ASSERT_AT(BtEvtListener, event_count, 16);
BT_ASSERT_AT(BtEvtListener, event_ids, 20);

/** The shared data "/tmp/shm_eds_regist_table", under the lock "BT_SRV_EDS_SEM_NAME". */
typedef struct BtEvtListenerTable {
    uint32_t next_handle;                        /* 0  handle of the next registration; 0: not initialised */
    BtEvtListener entries[BT_EVT_LISTENERS_MAX]; /* 4                                                      */
} BtEvtListenerTable;
BT_ASSERT_SIZE(BtEvtListenerTable, 8004);
BT_ASSERT_AT(BtEvtListenerTable, next_handle, 0);
BT_ASSERT_AT(BtEvtListenerTable, entries, 4);

/**
 * Registers a listener for a list of events.
 *
 * @param pno        process number that events are for; the low 16 bits count
 * @param tag        kept with the registration
 * @param count      number of ids, 36 and more being cut to 35; above 0x7FFFFFFF is refused
 * @param event_ids  the ids; never null, even for a count of 0
 * @return the handle, 1 and up; 0 when nothing was registered: null list, bad count, no lock or table, the table not
 *         initialised, or 50 listeners registered already
 */
BT_API uint32_t BT_SRV_EvtSrv_regist(uint32_t pno, uint32_t tag, uint32_t count, const uint32_t* event_ids);

/** Ends a registration. An unknown handle changes nothing. */
BT_API void BT_SRV_EvtSrv_deregist(uint32_t handle);

/** Marks a registration as wanting no events for the time being. An unknown handle changes nothing. */
BT_API void BT_SRV_EvtSrv_suspend(uint32_t handle);

/** Marks a registration as wanting its events again. An unknown handle changes nothing. */
BT_API void BT_SRV_EvtSrv_resume(uint32_t handle);

/**
 * Finds a listener in the table as this process linked it last; takes no lock, so the caller has to hold it.
 *
 * @param handle  handle of the registration; 0 finds the first free entry
 * @return the first entry with that handle; null when there is none or no table is linked
 */
BT_API BtEvtListener* find_HdlList(uint32_t handle);

/**
 * Prepares dispatch in the calling process and empties the listener table: all registrations end, and handles begin at
 * 1 again.
 */
BT_API void BT_EDS_initialize(void);

/**
 * Posts an event to PNO_BT_EDS, from where the listeners are served. Requires BT_EDS_initialize() in this process.
 *
 * A failure is reported in the log only; when the platform's message layer is unusable the process ends with code -1.
 *
 * @param unused   not looked at
 * @param message  the event, a BtMessage; a null pointer posts nothing
 */
BT_API void BT_EDS_dispatch(uint32_t unused, const void* message);

BT_EXTERN_C_END

#endif
