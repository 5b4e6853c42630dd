#include "Wbemcli.h"

#include <sys/wait.h>

#include <array>
#include <cstdio>
#include <sstream>
#include <string_view>

namespace tvx::host::test {
namespace {

/// One word for the shell.
std::string quoted(const std::string& word) {
  std::string result = "'";
  for (const char c : word) {
    result += c == '\'' ? std::string("'\\''") : std::string(1, c);
  }
  return result + "'";
}

constexpr std::array<std::string_view, 4> classPrefixes = {"TVXHBA_", "CIM_", "IBMSD_", "PG_"};
constexpr std::array<std::string_view, 2> nameSpaces = {"/root/torvex", "/root/pg_interop"};

}  // namespace

WbemcliAnswer wbemcli(const std::vector<std::string>& words) {
  std::string command = "wbemcli";
  for (const std::string& word : words) {
    command += " " + quoted(word);
  }
  WbemcliAnswer answer{-1, {}, {}};
  FILE* output = popen((command + " 2>&1").c_str(), "r");
  if (output == nullptr) {
    return answer;
  }
  char buffer[65536];
  for (std::size_t count; (count = fread(buffer, 1, sizeof buffer, output)) > 0;) {
    answer.text.append(buffer, count);
  }
  const int status = pclose(output);
  answer.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  std::istringstream stream(answer.text);
  for (std::string line; std::getline(stream, line);) {
    answer.lines.push_back(line);
  }
  return answer;
}

std::size_t WbemcliTexts::placeLength(const std::string& text, std::size_t position) const {
  if (text.compare(position, m_Host.size(), m_Host) != 0) {
    return 0;
  }
  const std::string_view rest = std::string_view(text).substr(position + m_Host.size());
  for (const std::string_view nameSpace : nameSpaces) {
    for (const std::string_view prefix : classPrefixes) {
      if (rest.starts_with(nameSpace) && rest.substr(nameSpace.size()).starts_with(prefix)) {
        return m_Host.size() + nameSpace.size();
      }
    }
  }
  return 0;
}

std::string WbemcliTexts::asInput(const std::string& name) const {
  std::string result = "http://";
  const std::size_t keys = name.find('.', m_Host.size());
  for (std::size_t i = 0; i < name.size();) {
    const std::size_t length = i > keys ? placeLength(name, i) : 0;
    if (length == 0) {
      result += name[i++];
    }
    i += length;
  }
  return result;
}

std::vector<End> WbemcliTexts::ends(const std::string& name) const {
  std::vector<End> result;
  std::vector<std::size_t> starts;
  for (std::size_t i = name.find('.', m_Host.size()); i < name.size(); ++i) {
    if (name[i] == '=' && placeLength(name, i + 1) != 0) {
      starts.push_back(i);
    }
  }
  for (std::size_t i = 0; i < starts.size(); ++i) {
    const std::size_t role = name.find_last_of(".,", starts[i]) + 1;
    const std::size_t place = starts[i] + 1;
    const std::size_t classStart = place + placeLength(name, place);
    std::size_t stop = name.size();
    if (i + 1 < starts.size()) {
      stop = name.find_last_of(',', starts[i + 1]);
    }
    result.push_back(
        {name.substr(role, starts[i] - role), name.substr(place, classStart - place) + ":" +
                                                  name.substr(classStart, stop - classStart)});
  }
  return result;
}

Listed WbemcliTexts::split(const std::string& line, const std::vector<std::string>& names) const {
  for (const std::string& name : names) {
    if (line.compare(0, name.size(), name) == 0 &&
        (line.size() == name.size() || line[name.size()] == ' ')) {
      return {name, line.substr(std::min(line.size(), name.size() + 1))};
    }
  }
  return {line.substr(0, line.find(' ')), {}};
}

std::string WbemcliTexts::className(const std::string& name) const {
  const std::size_t colon = name.find(':', m_Host.size());
  return name.substr(colon + 1, name.find('.', colon) - colon - 1);
}

}  // namespace tvx::host::test
