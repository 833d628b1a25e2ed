// The distributor's copy of the listener table.
#pragma once

#include <bt_service/bt_events.h>

namespace bt::sim {

class ListenerTable {
public:
    ListenerTable();

    // Copies the shared table under its lock. When the lock cannot be had the last copy stays in force.
    void refresh();

    static constexpr uint32_t kEntries = BT_EVT_LISTENERS_MAX;
    const BtEvtListener& entry(uint32_t index) const { return copy_.entries[index]; }
    // The entry is active and names the event among its first 35 ids.
    bool wants(uint32_t index, uint32_t event_id) const;

private:
    BtEvtListenerTable copy_{};
    const BtEvtListenerTable* shared_ = nullptr;
    uint32_t lock_ = 0;
};

} // namespace bt::sim
