// The logger's part in a fork.
#pragma once

namespace bt::platform {

void logger_before_fork();
void logger_after_fork();

// Writes a line to stderr unless logging is switched off by BT_PLATFORM_LOG=off.
void log_last_words(const char* text);

} // namespace bt::platform
