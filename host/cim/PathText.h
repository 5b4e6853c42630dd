// The text form of object paths: root/torvex:Class.Key="text",Number=1,Flag=TRUE,Ref="...".
#pragma once

#include <stdexcept>
#include <string>
#include <string_view>

#include "cim/Value.h"

namespace tvx::host {

class ClassCatalogue;

/// A path text that cannot be read; the message names the place and what was expected.
class PathError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Reads `[//host/][namespace:]Class[.key=value,...]`. Values are quoted texts with \" and \\,
/// whole numbers (uint64, or sint64 if negative), TRUE or FALSE; a path without namespace gets
/// `defaultNameSpace`. With `classes`, keys take their declared types: references are read out of
/// their quoted text, at any depth, and datetimes and numbers are checked. Throws PathError.
ObjectPath parsePath(std::string_view text, const std::string& defaultNameSpace,
                     const ClassCatalogue* classes = nullptr);

/// Gives the keys of a path their declared types and spelling where the class is known. Throws
/// PathError for a key that the class does not have or a text that does not fit its type.
void typeKeys(ObjectPath& path, const ClassCatalogue& classes);

/// Writes the form that `parsePath` reads; nested references are quoted with their quotes escaped.
std::string printPath(const ObjectPath& path);

/// `text` in double quotes with \" and \\ escapes.
std::string quotedText(std::string_view text);

}  // namespace tvx::host
