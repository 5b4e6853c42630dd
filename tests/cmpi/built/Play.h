// What a provider of the test library does, as text: steps with "; " between them.
//
//   deliver OBJECT    hands an instance over, and notes whether the caller wants more
//   out OBJECT        leaves an instance in the out parameter
//   echo              delivers the model, or leaves it in the out parameter
//   set NAME=VALUE    changes the instance or the call record at hand
//   up OPERATION ...  calls the server and notes what comes back: see Play.cpp
//   keep yes|no       forbids or allows unloading
//   break KIND        throws: runtime_error, bad_alloc, int, text, or an object of a class of its
//   own NUMBER            ends with this status
//
// Without a number the status is 0.
#pragma once

#include <cstdint>
#include <string>

#include "Scripted_Provider.h"

namespace cimrt::test {

/// Takes a note of what a provider saw.
using Note = void (*)(const std::string& line);

/// Makes a script follow the steps in an operation, which takes notes.
void play(Script& script, std::uint32_t operation, const std::string& steps, Note note);

/// Throws an exception of a kind.
[[noreturn]] void throw_kind(const std::string& kind);

}  // namespace cimrt::test
