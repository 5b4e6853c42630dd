// The commands that only look at class descriptions; they need no library.
#pragma once

#include <ostream>

#include "cim/ClassCatalogue.h"
#include "cli/Options.h"

namespace tvx::host {

/// `classes`: a line a class and, at the end, their number.
void describeClasses(const Options& options, const ClassCatalogue& classes, std::ostream& out);

/// `class NAME`: properties, keys and methods. Throws CommandError (UnknownClass).
void describeClass(const Options& options, const ClassCatalogue& classes, std::ostream& out);

/// "uint32 Name(in ref X Target, out uint8[] Features)".
std::string methodSignature(const MethodData& method);

}  // namespace tvx::host
