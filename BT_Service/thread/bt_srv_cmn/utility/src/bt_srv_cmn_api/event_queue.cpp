// The queue of events that a process cannot handle yet.
#include "log_line.h"
#include "message_trace.h"

#include <bt_service/bt_event_queue.h>

#include <cstdlib>
#include <cstring>

namespace bt::cmn {
namespace {

bool is_empty(const BtQueueNode& head)
{
    return head.link == &head;
}

// Counts the events of a queue that is not empty and delivers its last node.
int count_events(BtQueueNode* head, BtQueueNode** last)
{
    int count = 1;
    for (*last = head; (*last)->link != nullptr; *last = (*last)->link)
        ++count;
    return count;
}

// Moves every event one place forward and frees the node that is left over at the end. The nodes keep their places.
// Returns the number of events that remain.
int drop_first(BtQueueNode* head)
{
    if (head->link == nullptr) {
        std::memset(head->slot, 0, sizeof head->slot);
        head->link = head;
        return 0;
    }
    int remaining = 0;
    BtQueueNode* node = head;
    BtQueueNode* before = head;
    for (; node->link != nullptr; node = node->link) {
        std::memcpy(node->slot, node->link->slot, sizeof node->slot);
        before = node;
        ++remaining;
    }
    std::free(node);
    before->link = nullptr;
    return remaining;
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

uint32_t BT_CMN_enqueueMsg(const void* message, BtQueueNode* head)
{
    CMN_LOG_START();
    if (message == nullptr || head == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p, queue = %p ", CMN_API_PLACE, message, static_cast<void*>(head));
        return ended(__func__, 1U);
    }
    if (is_empty(*head)) {
        std::memcpy(head->slot, message, sizeof head->slot);
        head->link = nullptr;
        CMN_LOG(CMN_AT "enqueued into the top. ( event cnt = 1 ) ", CMN_API_PLACE);
        return ended(__func__, 0U);
    }

    BtQueueNode* last = nullptr;
    const int count = count_events(head, &last);
    auto* const node = static_cast<BtQueueNode*>(std::malloc(sizeof(BtQueueNode)));
    if (node == nullptr) {
        CMN_LOG(CMN_AT "malloc err. ( event cnt = %d ) ", CMN_API_PLACE, count);
        return ended(__func__, 1U);
    }
    std::memcpy(node->slot, message, sizeof node->slot);
    node->link = nullptr;
    last->link = node;
    CMN_LOG(CMN_AT "enqueued into the bottom. ( event cnt = %d ) ", CMN_API_PLACE, count + 1);
    return ended(__func__, 0U);
}

uint32_t BT_CMN_queueMsg(void* buffer, BtQueueNode* head)
{
    CMN_LOG_START();
    if (buffer == nullptr || head == nullptr) {
        CMN_LOG("[API][%s] param err. data = %p, queue = %p ", __func__, buffer, static_cast<void*>(head));
        return ended(__func__, 1U);
    }
    if (is_empty(*head)) {
        CMN_LOG("[API][%s] dequeued is empty. ( event cnt = %d ) ", __func__, 0);
        return ended(__func__, 0U);
    }
    std::memcpy(buffer, head->slot, sizeof head->slot);
    const int remaining = drop_first(head);
    trace_message(buffer);
    CMN_LOG(CMN_AT "dequeued the top event. ( event cnt = %d ) ", CMN_API_PLACE, remaining);
    return ended(__func__, 1U);
}
