#include "btsvc/event_line.h"

#include "catalogue/print.h"

namespace bt::client {

void print_event(const BtMessage& event, Output& output)
{
    const catalogue::Decoded decoded = catalogue::decode(event);
    if (!output.json()) {
        output.line(catalogue::to_text(decoded));
        return;
    }
    nlohmann::ordered_json line{{"type", "event"}};
    line.update(catalogue::to_json(decoded));
    output.object(line);
}

} // namespace bt::client
