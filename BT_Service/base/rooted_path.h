// Absolute paths of the unit's file system, moved below BT_SERVICE_ROOT for work on a desk.
#pragma once

namespace bt {

// A path of the unit. BT_SERVICE_ROOT is read once per process; it is ignored in a set-user-id program. A path that
// gets too long becomes empty, so that opening it fails.
class RootedPath {
public:
    explicit RootedPath(const char* absolute);
    const char* c_str() const { return text_; }

private:
    char text_[1024];
};

} // namespace bt
