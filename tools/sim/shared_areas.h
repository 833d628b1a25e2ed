// Everything that a unit creates before its services start: the domain, the shared data, the folders and the image file.
#pragma once

#include <stdexcept>
#include <string>

namespace bt::sim {

struct UnitError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// A live unit has the domain already.
struct DomainTaken : UnitError {
    using UnitError::UnitError;
};

// Opens the domain for this unit, for as long as the process lives. What a dead unit left is removed, or kept when
// applications of that time still run in it. Throws DomainTaken or UnitError.
void take_domain();

// Zero-filled shared data of every area, with its full size.
void create_areas();

// The folders under `root`, and an image file without content when there is none.
void create_folders(const std::string& root);

} // namespace bt::sim
