#include "sim/machine_tables.h"

#include <set>

namespace bt::sim {

std::vector<BtMatrixRow> matrix_of(std::initializer_list<Rule> rules)
{
    std::vector<BtMatrixRow> matrix;
    for (const Rule& rule : rules)
        for (const uint32_t state : rule.states)
            for (const uint32_t cid : rule.cids)
                matrix.push_back({state, cid, rule.action});
    matrix.push_back({BT_TABLE_END, BT_TABLE_END, nullptr});
    return matrix;
}

std::vector<BtDispatchRow> dispatch_of(const std::vector<BtMatrixRow>& matrix, uint32_t machine)
{
    std::set<uint32_t> cids;
    for (const BtMatrixRow& row : matrix)
        if (row.state != BT_TABLE_END) cids.insert(row.cid);

    std::vector<BtDispatchRow> rows;
    for (const uint32_t cid : cids)
        rows.push_back({cid, machine});
    return rows;
}

} // namespace bt::sim
