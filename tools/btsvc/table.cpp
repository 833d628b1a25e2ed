#include "btsvc/table.h"

#include "catalogue/print.h"

#include <algorithm>

namespace bt::client {
namespace {

// Characters, not bytes: continuation bytes of UTF-8 take no place on a terminal.
size_t width(const std::string& text)
{
    return static_cast<size_t>(
        std::count_if(text.begin(), text.end(), [](char c) { return (static_cast<unsigned char>(c) & 0xC0) != 0x80; }));
}

std::string joined(const std::vector<std::string>& cells, const std::vector<size_t>& widths)
{
    std::string line;
    for (size_t i = 0; i < cells.size(); ++i) {
        line += (i == 0 ? "" : "  ") + cells[i];
        if (i + 1 < cells.size()) line.append(widths[i] - width(cells[i]), ' ');
    }
    return line;
}

} // namespace

std::string cell_text(const nlohmann::ordered_json& value)
{
    if (value.is_null()) return "-";
    if (value.is_string())
        return value.get_ref<const std::string&>().empty() ? "-" : catalogue::printable(value.get<std::string>());
    if (value.is_boolean()) return value.get<bool>() ? "yes" : "no";
    if (!value.is_array()) return value.dump();

    std::string text;
    for (const auto& item : value)
        text += (text.empty() ? "" : ",") + cell_text(item);
    return text.empty() ? "-" : text;
}

void Table::print(Output& output, const std::string& heading, const std::string& none) const
{
    if (output.json()) {
        for (const nlohmann::ordered_json& record : records_) {
            nlohmann::ordered_json line{{"type", type_}};
            line.update(record);
            output.object(line);
        }
        return;
    }
    if (!heading.empty()) output.line(heading);
    if (records_.empty()) {
        output.line(none);
        return;
    }

    std::vector<std::vector<std::string>> rows(1);
    for (const Column& column : columns_)
        rows[0].push_back(column.title);
    for (const nlohmann::ordered_json& record : records_) {
        rows.emplace_back();
        for (const Column& column : columns_)
            rows.back().push_back(cell_text(record.value(column.key, nlohmann::ordered_json())));
    }
    std::vector<size_t> widths(columns_.size());
    for (const auto& row : rows)
        for (size_t i = 0; i < row.size(); ++i)
            widths[i] = std::max(widths[i], width(row[i]));
    for (const auto& row : rows)
        output.line(joined(row, widths));
}

} // namespace bt::client
