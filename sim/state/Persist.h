// What calls changed, kept in a file from one process to the next.
#pragma once

#include <string>
#include <string_view>

#include "state/World.h"

namespace tvx::sim {

/// Whether a successful call of this entry point changes what is kept.
bool changes_state(std::string_view entry_point_name);

/// Writes what calls can change to the file, whole or not at all, readable by its owner alone.
/// Answers an empty text, or what went wrong.
std::string save_state(const World& world, const std::string& path);

/// Puts the world into the state of the file, as far as it tells of ports that the world has; what
/// waited for a reset or a reboot is active then. No file is no state. A file that is not the
/// caller's own, or that others may write, is refused. Answers an empty text, or what went wrong.
std::string restore_state(World& world, const std::string& path);

}  // namespace tvx::sim
