// Libraries that lack some of their entry points.
#pragma once

#include <string>
#include <vector>

namespace tvx::sim {

/// Takes names out of the dynamic symbol table of the loaded library that contains `address`, in
/// memory only, so that a later dlsym does not find them. To be called while that library is being
/// loaded, before anybody can look a name up. Answers how many were taken out.
int hide_symbols(const void* address, const std::vector<std::string>& names);

}  // namespace tvx::sim
