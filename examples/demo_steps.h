// One step of the demonstration: what is asked, what was posted, what came back, and whether it is what was expected.
#pragma once

#include "posted_trace.h"

#include "catalogue/decode.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace demo {

using bt::catalogue::Decoded;

class Steps {
public:
    explicit Steps(const std::string& root) : trace_(root) {}

    void begin(const std::string& title);
    void asked(const std::string& call) const;
    // Waits for the answer to a request; shows the message that the unit took, the events on the way, which are kept in
    // events(), and the answer.
    std::optional<Decoded> await(const char* request);
    void answered(const std::string& what) const;
    // Ends the program with a message that names the step unless `held`.
    void expect(bool held, const std::string& what) const;

    const std::vector<Decoded>& events() const { return events_; }

private:
    void show_posted(uint16_t request_id);

    PostedTrace trace_;
    int number_ = 0;
    std::string title_;
    std::vector<Decoded> events_;
};

// A field of an event; 0 and empty when it is not there.
int64_t number_of(const Decoded& event, const std::string& field);
std::vector<uint8_t> bytes_of(const Decoded& event, const std::string& field);

} // namespace demo
