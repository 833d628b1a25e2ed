// Standard output: lines of text, or one JSON object per line.
#pragma once

#include <nlohmann/json.hpp>

#include <string_view>

namespace bt::client {

// Writes are checked; one that fails ends the command with kNoOutput, silently when the reader has gone.
class Output {
public:
    explicit Output(bool json) : json_(json) {}

    bool json() const { return json_; }
    void line(std::string_view text);
    // One line: {"version":1, ...members}. Text that is not UTF-8 is carried with replacement characters.
    void object(const nlohmann::ordered_json& members);

private:
    bool json_;
};

} // namespace bt::client
