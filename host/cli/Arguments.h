// name=value words of the command line, typed from the class descriptions.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "Broker.h"
#include "cim/ClassCatalogue.h"

namespace tvx::host {

/// Turns a path as typed into a complete one, by looking up keys that were left out.
using PathResolver = std::function<ObjectPath(const std::string& text)>;

/// Reads the text of one value. Scalars: numbers in decimal or 0x form, true/false/1/0, texts,
/// datetimes, a character or its number; references: path texts; embedded instances: JSON or
/// @file. Arrays: [JSON], or elements between commas; uint8 arrays also @file. Throws
/// CommandError (BadArgument, or File) naming parameter and type.
Value parseValue(const FeatureData& feature, const std::string& text, const ClassCatalogue& classes,
                 const PathResolver& resolve);

/// Arguments of a method. A parameter that the method does not have, or that goes out only, is
/// refused with near names.
NamedValues parseArguments(const ClassData& classData, const MethodData& method,
                           const std::vector<std::string>& words, const ClassCatalogue& classes,
                           const PathResolver& resolve);

/// Properties of a class.
NamedValues parseProperties(const ClassData& classData, const std::vector<std::string>& words,
                            const ClassCatalogue& classes, const PathResolver& resolve);

/// "uint16[] Name", "ref Class Name".
std::string signatureOf(const FeatureData& feature);

}  // namespace tvx::host
