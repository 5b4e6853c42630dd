// Runs a measurement in a process of its own, so that none sees another's memory.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace tvx::bench {

/// What a measurement found, as rows of texts: they go through a pipe.
using Rows = std::vector<std::vector<std::string>>;

/// Forks, runs `measure` in the child and answers its rows. The caller must have no other thread.
/// Ends the program if the child fails.
Rows inChild(const std::function<Rows()>& measure);

}  // namespace tvx::bench
