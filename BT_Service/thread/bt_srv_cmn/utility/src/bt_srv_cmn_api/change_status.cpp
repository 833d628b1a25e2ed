// The change of a machine's state.
#include "log_line.h"

#include <bt_service/bt_state_machine.h>

namespace bt::cmn {
namespace {

using Step = void (*BtStateRow::*)(void);

// A state without a row has no parent; of several rows the last counts.
const BtStateRow* parent_of(uint32_t state, const BtStateRow* table)
{
    const BtStateRow* parent = nullptr;
    for (const BtStateRow* row = table; row->state != BT_TABLE_END; ++row)
        if (row->state == state) parent = row->parent;
    return parent;
}

// Whether all functions are there that leaving or entering the state will run.
bool can_run(uint32_t state, const BtStateRow* table, Step step, bool with_ancestors)
{
    for (const BtStateRow* row = table; row->state != BT_TABLE_END; ++row) {
        if (row->state != state) continue;
        for (const BtStateRow* at = row; at != nullptr; at = with_ancestors ? at->parent : nullptr)
            if (at->*step == nullptr) return false;
    }
    return true;
}

bool leave(uint32_t state, const BtStateRow* table, bool with_ancestors)
{
    bool found = false;
    for (const BtStateRow* row = table; row->state != BT_TABLE_END; ++row) {
        if (row->state != state) continue;
        found = true;
        if (with_ancestors)
            bt_cmn_changeStatusExit(row);
        else
            row->exit();
    }
    return found;
}

bool enter(uint32_t state, const BtStateRow* table, bool with_ancestors, uint32_t* current_state)
{
    bool found = false;
    for (const BtStateRow* row = table; row->state != BT_TABLE_END; ++row) {
        if (row->state != state) continue;
        found = true;
        if (with_ancestors)
            bt_cmn_changeStatusEntry(row);
        else
            row->entry();
        *current_state = state;
    }
    return found;
}

// The end of a change whose current state has no row; it writes no end line.
int32_t refuse_unknown(const char* function, int line, uint32_t old_state)
{
    CMN_LOG(CMN_AT "param err. current_state = 0x%04x, tmp_state = 0x%04x", kApiSource, function, line, old_state,
            static_cast<unsigned>(BT_TABLE_END));
    CMN_LOG(CMN_AT "ret = %d", kApiSource, function, line, kFailure);
    return kFailure;
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

int32_t BT_CMN_changeStatus(uint32_t* current_state, uint32_t next_state, const BtStateRow* state_table)
{
    CMN_LOG_START();
    if (current_state == nullptr || state_table == nullptr) {
        CMN_LOG(CMN_AT "param err. current_state = %p, state_table = %p", CMN_API_PLACE,
                static_cast<void*>(current_state), static_cast<const void*>(state_table));
        return ended(__func__, kFailure);
    }
    const uint32_t old_state = *current_state;
    if (old_state == next_state) {
        CMN_LOG(CMN_AT "param err. current_state = 0x%04x, next_state = 0x%04x", CMN_API_PLACE, old_state, next_state);
        return ended(__func__, kFailure);
    }
    if (state_table->state == BT_TABLE_END) return refuse_unknown(__func__, __LINE__, old_state);

    const bool with_ancestors = parent_of(old_state, state_table) != parent_of(next_state, state_table);
    if (!can_run(old_state, state_table, &BtStateRow::exit, with_ancestors)) {
        CMN_LOG(CMN_AT "param err. exit = %p ", CMN_API_PLACE, static_cast<void*>(nullptr));
        return ended(__func__, kFailure);
    }
    if (!can_run(next_state, state_table, &BtStateRow::entry, with_ancestors)) {
        CMN_LOG(CMN_AT "param err. entry = %p ", CMN_API_PLACE, static_cast<void*>(nullptr));
        return ended(__func__, kFailure);
    }
    if (!leave(old_state, state_table, with_ancestors)) return refuse_unknown(__func__, __LINE__, old_state);
    const bool entered = enter(next_state, state_table, with_ancestors, current_state);
    return ended(__func__, entered ? kSuccess : kFailure);
}
