#include "posted_trace.h"

#include <cstdlib>
#include <vector>

namespace demo {
namespace {

constexpr const char* kMark = "BTSRV ";

// "BTSRV A091 01000000": the id, then the payload in hexadecimal.
std::optional<bt::catalogue::Decoded> parse(const std::string& line)
{
    const size_t mark = line.find(kMark);
    if (mark == std::string::npos) return std::nullopt;

    const std::string digits = line.substr(mark + std::string(kMark).size());
    const size_t blank = digits.find(' ');
    if (blank == std::string::npos) return std::nullopt;

    std::vector<uint8_t> payload;
    for (size_t at = blank + 1; at + 2 <= digits.size(); at += 2)
        payload.push_back(static_cast<uint8_t>(std::strtoul(digits.substr(at, 2).c_str(), nullptr, 16)));
    const auto id = static_cast<uint16_t>(std::strtoul(digits.substr(0, blank).c_str(), nullptr, 16));
    return bt::catalogue::decode(id, payload.data(), payload.size());
}

} // namespace

PostedTrace::PostedTrace(const std::string& root) : file_(root + "/tmp/bt_cmn.log") {}

std::optional<bt::catalogue::Decoded> PostedTrace::next(uint16_t id)
{
    file_.clear(); // the end reached last time may have moved on
    for (std::string line; std::getline(file_, line);) {
        const auto message = parse(line);
        if (message && message->id == id) return message;
    }
    return std::nullopt;
}

} // namespace demo
