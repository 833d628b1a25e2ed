#include "btsvc/calls.h"

#include "btsvc/failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>

namespace bt::client {
namespace {

constexpr const char* kPrefix = "BT_SRV_";

std::string lower(std::string text)
{
    for (char& c : text)
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

std::string similar_calls(const std::string& name)
{
    std::string text;
    for (const Call& call : all_calls())
        if (name.size() >= 3 && lower(call.name).find(lower(name)) != std::string::npos)
            text += std::string(text.empty() ? "; did you mean " : ", ") + call.name;
    return text;
}

} // namespace

std::vector<Call> all_calls()
{
    std::vector<Call> calls;
    for (const CallTable& table : {connection_calls()})
        calls.insert(calls.end(), table.first, table.end);
    return calls;
}

Call find_call(const std::string& name)
{
    const std::string bare = name.rfind(kPrefix, 0) == 0 ? name.substr(std::string(kPrefix).size()) : name;
    for (const Call& call : all_calls())
        if (bare == call.name) return call;
    throw Failure(kUsage, fmt::format("\"{}\" is no request or query; `btsvc call --list` shows them{}", name,
                                      similar_calls(bare)));
}

} // namespace bt::client
