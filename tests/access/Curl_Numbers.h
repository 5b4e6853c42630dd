// What libcurl's public header says, apart from the names that are used here.
#pragma once

#include <vector>

namespace tvx::test {

/// The numbers in the order of the test; empty if the header is not on this machine.
std::vector<long> publishedCurlNumbers();

}  // namespace tvx::test
