// Debian's command line client, and the texts that it prints.
#pragma once

#include <string>
#include <vector>

namespace tvx::host::test {

struct WbemcliAnswer {
  int exitCode;
  std::vector<std::string> lines;  ///< what it prints, errors included
  std::string text;                ///< the same in one piece
};

/// Runs `wbemcli` with these words.
WbemcliAnswer wbemcli(const std::vector<std::string>& words);

/// One end of an association.
struct End {
  std::string role;
  std::string path;  ///< "host/namespace:Class.keys"
};

/// An instance as listed: name and properties.
struct Listed {
  std::string name;
  std::string properties;
};

/// Reads what the client prints for the server at `host`. It leaves out the colon between the
/// namespace and the class of references, and takes references without both.
class WbemcliTexts {
 public:
  explicit WbemcliTexts(std::string host) : m_Host(std::move(host)) {}

  /// A printed name as the client takes it: "http://host/namespace:Class.keys".
  std::string asInput(const std::string& name) const;
  /// The references among the keys of a printed name.
  std::vector<End> ends(const std::string& name) const;
  /// Splits a line of `ei` or `gi`, whose name is among `names`, or is the first word if it is not.
  Listed split(const std::string& line, const std::vector<std::string>& names) const;

  std::string className(const std::string& name) const;

 private:
  /// Length of "host/namespace" at `position` if a class name follows it, else 0.
  std::size_t placeLength(const std::string& text, std::size_t position) const;

  std::string m_Host;
};

}  // namespace tvx::host::test
