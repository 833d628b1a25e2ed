// Lookups in a request-response table.
#include <bt_service/bt_transport.h>

namespace bt::cmn {
namespace {

// First row whose column holds the id. The column's end row is not one of them, nor is any row behind the 256th.
const BtResponseRow* find_row(const BtResponseRow* table, uint16_t BtResponseRow::*column, uint32_t id)
{
    for (int i = 0; i < BT_RESPONSE_ROWS_MAX; ++i) {
        const uint16_t stored = table[i].*column;
        if (stored == BT_RESPONSE_END) return nullptr;
        if (stored == id) return &table[i];
    }
    return nullptr;
}

} // namespace
} // namespace bt::cmn

int32_t BT_CMN_get_response_from_request(const BtResponseRow* table, uint32_t request, uint16_t* response,
                                         uint16_t* data_size)
{
    if (table == nullptr || response == nullptr || data_size == nullptr) return 1;

    const BtResponseRow* const row = bt::cmn::find_row(table, &BtResponseRow::request, request);
    if (row == nullptr) return 1;
    *response = row->response;
    *data_size = row->data_size;
    return 0;
}

int32_t BT_CMN_get_data_size_from_response(const BtResponseRow* table, uint32_t response, uint16_t* data_size)
{
    if (table == nullptr || data_size == nullptr) return 1;

    const BtResponseRow* const row = bt::cmn::find_row(table, &BtResponseRow::response, response);
    if (row == nullptr) return 1;
    *data_size = row->data_size;
    return 0;
}
