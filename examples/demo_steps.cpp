#include "demo_steps.h"

#include "catalogue/print.h"

#include <bt_platform/host.h>

#include <cstdio>
#include <cstdlib>

namespace demo {
namespace {

constexpr int32_t kAnswerTimeoutMs = 15000;

void show(const char* label, const std::string& text)
{
    std::printf("   %-7s %s\n", label, text.c_str());
}

} // namespace

void Steps::begin(const std::string& title)
{
    title_ = title;
    events_.clear();
    std::printf("%d. %s\n", ++number_, title.c_str());
}

void Steps::asked(const std::string& call) const
{
    show("call", call);
}

void Steps::show_posted(uint16_t request_id)
{
    const auto message = trace_.next(request_id);
    expect(message.has_value(), "the unit did not trace the request");
    show("posted", bt::catalogue::to_text(*message));
}

std::optional<Decoded> Steps::await(const char* request)
{
    const uint16_t request_id = bt::catalogue::find_request(request)->id;
    for (BtMessage message{}; bt_host_receive(&message, sizeof message, kAnswerTimeoutMs) == 1;) {
        const Decoded event = bt::catalogue::decode(message);
        if (event.id != bt::catalogue::answer_to(request_id)) {
            events_.push_back(event);
            continue;
        }
        show_posted(request_id);
        for (const Decoded& earlier : events_)
            show("event", bt::catalogue::to_text(earlier));
        show("answer", bt::catalogue::to_text(event));
        return event;
    }
    return std::nullopt;
}

void Steps::answered(const std::string& what) const
{
    show("answer", what);
}

void Steps::expect(bool held, const std::string& what) const
{
    if (held) return;
    std::printf("   FAILED  %s\n", what.c_str());
    std::fflush(stdout);
    std::fprintf(stderr, "demo_app: step %d (%s) failed: %s\n", number_, title_.c_str(), what.c_str());
    std::exit(1);
}

int64_t number_of(const Decoded& event, const std::string& field)
{
    for (const bt::catalogue::Value& value : event.values)
        if (value.field->name == field && !value.numbers.empty()) return value.numbers.front();
    return 0;
}

std::vector<uint8_t> bytes_of(const Decoded& event, const std::string& field)
{
    for (const bt::catalogue::Value& value : event.values)
        if (value.field->name == field) return value.bytes;
    return {};
}

} // namespace demo
