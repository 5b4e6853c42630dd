#include "Child.h"

#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <sstream>

namespace tvx::bench {

namespace {

void writeRows(int pipe, const Rows& rows) {
  std::FILE* const out = fdopen(pipe, "w");
  if (out == nullptr) return;
  for (const auto& row : rows) {
    for (const std::string& cell : row) std::fprintf(out, "%s\t", cell.c_str());
    std::fprintf(out, "\n");
  }
  std::fclose(out);
}

std::string readAll(int pipe) {
  std::string text;
  char buffer[4096];
  for (ssize_t size = 0; (size = read(pipe, buffer, sizeof buffer)) > 0;)
    text.append(buffer, static_cast<std::size_t>(size));
  close(pipe);
  return text;
}

Rows parseRows(const std::string& text) {
  Rows rows;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    std::istringstream cells(line);
    rows.emplace_back();
    for (std::string cell; std::getline(cells, cell, '\t');) rows.back().push_back(cell);
  }
  return rows;
}

[[noreturn]] void give_up(const char* what) {
  std::perror(what);
  std::exit(1);
}

}  // namespace

Rows inChild(const std::function<Rows()>& measure) {
  int ends[2];
  if (pipe(ends) != 0) give_up("pipe");
  std::fflush(nullptr);
  const pid_t child = fork();
  if (child < 0) give_up("fork");
  if (child == 0) {
    close(ends[0]);
    writeRows(ends[1], measure());
    std::exit(0);
  }
  close(ends[1]);
  const std::string text = readAll(ends[0]);
  int status = 0;
  waitpid(child, &status, 0);
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
    std::fprintf(stderr, "a measurement failed\n");
    std::exit(1);
  }
  return parseRows(text);
}

}  // namespace tvx::bench
