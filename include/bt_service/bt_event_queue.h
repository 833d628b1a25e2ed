/**
 * @file
 * A first-in, first-out queue for messages that a process cannot handle yet.
 *
 * The owner provides the head, whose slot holds the first event; only further events are allocated. A queue is created
 * empty by setting the link of its head to the head itself:
 *
 *     static BtQueueNode queue;
 *     queue.link = &queue;
 *
 * A queue belongs to one thread, which both queues and takes. Nodes are freed by taking events: a queue is emptied
 * before it is discarded.
 */
#ifndef BT_SERVICE_BT_EVENT_QUEUE_H
#define BT_SERVICE_BT_EVENT_QUEUE_H

#include <bt_service/bt_message.h>
#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

/** A queued event; the head of a queue is one too. */
typedef struct queue_node {
    uint8_t slot[BT_MESSAGE_SIZE]; /*    0  a whole BtMessage                                         */
    struct queue_node* link;       /* 1024  the next event; in the head: null none, itself when empty */
} BtQueueNode;
BT_ASSERT_AT(BtQueueNode, slot, 0);
BT_ASSERT_AT(BtQueueNode, link, 1024);

/**
 * Appends an event.
 *
 * @param message  a BtMessage, all 1,024 bytes of which are copied
 * @param head     head of the queue
 * @return 0 queued; 1 null pointer or no memory, the queue is unchanged
 */
BT_API uint32_t BT_CMN_enqueueMsg(const void* message, BtQueueNode* head);

/**
 * Takes the first event and traces it (bt_transport.h).
 *
 * @param buffer  receives the whole slot, 1,024 bytes; untouched when the queue is empty
 * @param head    head of the queue
 * @return 1 an event was taken, or a null pointer; 0 the queue was empty
 */
BT_API uint32_t BT_CMN_queueMsg(void* buffer, BtQueueNode* head);

BT_EXTERN_C_END

#endif
