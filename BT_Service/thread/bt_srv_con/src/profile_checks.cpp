// Which profiles a registered device supports or is connected on, and which ones a filter names.
#include <bt_service/bt_connection_store.h>

namespace {

// The entry that a profile index selects, null for none. Entry 2 has no index.
const BtConProfileEntry* entry_of(const BtConRegDevInfo* record, uint32_t profile_index)
{
    if (record == nullptr || profile_index >= BT_CON_PROFILE_INDEXES) return nullptr;
    return &record->profile[profile_index < 2 ? profile_index : profile_index + 1];
}

template <class Matches>
int32_t any_of(const BtConProfileFilter* filter, Matches matches)
{
    if (filter == nullptr) return 0;
    const auto* const indexes = reinterpret_cast<const uint32_t*>(filter + 1);
    for (int32_t i = 0; i < filter->count; ++i)
        if (matches(indexes[i])) return 1;
    return 0;
}

} // namespace

int32_t bt_con_IsCheckRegDevSupportProfile(const BtConRegDevInfo* record, uint32_t profile_index)
{
    const BtConProfileEntry* const entry = entry_of(record, profile_index);
    return entry != nullptr && entry->supported == 1 ? 1 : 0;
}

int32_t bt_con_IsCheckRegDevConnectProfile(const BtConRegDevInfo* record, uint32_t profile_index)
{
    const BtConProfileEntry* const entry = entry_of(record, profile_index);
    return entry != nullptr && entry->connected == 1 ? 1 : 0;
}

int32_t bt_con_IsCheckProfileFilter(const BtConProfileFilter* filter, uint32_t profile_index)
{
    return any_of(filter, [=](uint32_t named) { return named == profile_index; });
}

int32_t bt_con_IsCheckRegDevSupportProfile4Filter(const BtConRegDevInfo* record, const BtConProfileFilter* filter)
{
    return any_of(filter, [=](uint32_t named) { return bt_con_IsCheckRegDevSupportProfile(record, named) == 1; });
}
