// How much memory this process has, by the allocator's books and by the system's.
#pragma once

#include <cstddef>

namespace tvx::bench {

/// Bytes in blocks that are allocated now, the allocator's own bytes around them included.
std::size_t allocatedBytes();

/// Gives what is free back to the system, so that what comes next does not depend on it.
void returnFreedMemory();

/// Bytes of this process that are in memory, pages shared with others included.
std::size_t residentBytes();

}  // namespace tvx::bench
