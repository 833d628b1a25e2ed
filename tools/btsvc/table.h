// Records as an aligned table, or as one JSON object per line.
#pragma once

#include "btsvc/output.h"

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace bt::client {

class Table {
public:
    struct Column {
        const char* key; // member of the record
        const char* title; // above the column
    };

    // `type` is the "type" member of each JSON object. JSON has all members of a record, text those of the columns.
    Table(const char* type, std::vector<Column> columns) : type_(type), columns_(std::move(columns)) {}

    void add(nlohmann::ordered_json record) { records_.push_back(std::move(record)); }
    bool empty() const { return records_.empty(); }
    // Text has `heading` above the table; `none` stands for a table without records.
    void print(Output& output, const std::string& heading, const std::string& none) const;

private:
    const char* type_;
    std::vector<Column> columns_;
    std::vector<nlohmann::ordered_json> records_;
};

// A value as text: lists joined by commas, "-" for nothing, safe for a terminal.
std::string cell_text(const nlohmann::ordered_json& value);

} // namespace bt::client
