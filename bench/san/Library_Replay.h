// The calls of a scan without the scan, so that the provider's own share can be told.
#pragma once

#include <cstddef>

namespace tvx::bench {

/// Calls the SNIA library as a scan of the first adapter does: the mapping, and for each row an
/// open, three inquiries, the capacity and a close. Keeps nothing. Answers the number of rows.
std::size_t replayScan();

}  // namespace tvx::bench
