// Reads debug switch files: one switch a line, "key=value;".
#pragma once

#include <cstdio>

namespace bt::cmn {

// Sets the log flags that the file switches on; no line switches one off.
void read_switches(std::FILE* file);

} // namespace bt::cmn
