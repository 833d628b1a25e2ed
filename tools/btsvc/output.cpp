#include "btsvc/output.h"

#include "btsvc/failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstring>
#include <string>

#include <unistd.h>

namespace bt::client {
namespace {

constexpr int kJsonVersion = 1;

void write_all(std::string_view text)
{
    while (!text.empty()) {
        const ssize_t written = ::write(STDOUT_FILENO, text.data(), text.size());
        if (written >= 0) {
            text.remove_prefix(static_cast<size_t>(written));
        } else if (errno == EPIPE) {
            throw Failure(kNoOutput, "");
        } else if (errno != EINTR) {
            throw Failure(kNoOutput, fmt::format("standard output: {}; nothing more is written", std::strerror(errno)));
        }
    }
}

} // namespace

void Output::line(std::string_view text)
{
    write_all(std::string(text) + "\n");
}

void Output::object(const nlohmann::ordered_json& members)
{
    nlohmann::ordered_json object;
    object["version"] = kJsonVersion;
    object.update(members);
    line(object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace));
}

} // namespace bt::client
