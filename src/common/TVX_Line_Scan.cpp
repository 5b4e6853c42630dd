#include "common/TVX_Line_Scan.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <utility>
#include <vector>

namespace cimrt {

namespace {

constexpr std::size_t CHUNK = 256 * 1024;

/// Gets a line in parts and keeps it if the word is in it, across the seams too.
class Line_Collector {
 public:
  Line_Collector(std::string_view word, std::size_t limit) : m_Word(word), m_Limit(limit) {}

  void addPart(std::string_view part) {
    if (!m_bFound) m_bFound = isIn(part);
    m_Line.append(part.substr(0, TVX_SCANNED_LINE - m_Line.size()));
  }

  void endLine() {
    if (m_bFound) keep();
    m_Line.clear();
    m_Seam.clear();
    m_bFound = false;
  }

  std::deque<std::string> take() { return std::move(m_Lines); }

 private:
  bool isIn(std::string_view part) {
    if (part.find(m_Word) != std::string_view::npos) return true;
    // What the last parts ended with may be the beginning of the word.
    const std::size_t overlap = m_Word.empty() ? 0 : m_Word.size() - 1;
    m_Seam.append(part.substr(0, overlap));
    if (m_Seam.find(m_Word) != std::string::npos) return true;
    if (part.size() > overlap) m_Seam = part.substr(part.size() - overlap);
    if (m_Seam.size() > overlap) m_Seam.erase(0, m_Seam.size() - overlap);
    return false;
  }

  void keep() {
    if (m_Limit == 0) return;
    if (m_Lines.size() == m_Limit) m_Lines.pop_front();
    std::erase(m_Line, '\0');
    m_Lines.push_back(m_Line);
  }

  const std::string_view m_Word;
  const std::size_t m_Limit;
  std::deque<std::string> m_Lines;
  std::string m_Line;  ///< the present line as far as it is kept
  std::string m_Seam;  ///< the end of what was searched of it
  bool m_bFound = false;
};

/// A descriptor that closes itself.
class Opened_File {
 public:
  // A pipe without a writer must not keep the caller waiting.
  explicit Opened_File(const char* path)
      : m_Descriptor(::open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {}
  ~Opened_File() {
    if (m_Descriptor >= 0) ::close(m_Descriptor);
  }
  Opened_File(const Opened_File&) = delete;
  Opened_File& operator=(const Opened_File&) = delete;

  bool isRegular() const {
    struct stat info {};
    return m_Descriptor >= 0 && ::fstat(m_Descriptor, &info) == 0 && S_ISREG(info.st_mode);
  }
  /// Bytes read; 0 at the end and after a failure.
  std::size_t read(std::vector<char>& chunk) const {
    ssize_t count = 0;
    do {
      count = ::read(m_Descriptor, chunk.data(), chunk.size());
    } while (count < 0 && errno == EINTR);
    return count > 0 ? static_cast<std::size_t>(count) : 0;
  }

 private:
  const int m_Descriptor;
};

/// Hands the lines of a chunk to the collector; the last one may go on in the next chunk.
void scan(std::string_view chunk, Line_Collector& collector) {
  for (std::size_t end = chunk.find('\n'); end != std::string_view::npos; end = chunk.find('\n')) {
    collector.addPart(chunk.substr(0, end));
    collector.endLine();
    chunk.remove_prefix(end + 1);
  }
  collector.addPart(chunk);
}

}  // namespace

std::deque<std::string> tvxLastLinesWith(const char* path, std::string_view word,
                                         std::size_t limit) {
  const Opened_File file(path);
  if (!file.isRegular()) return {};
  Line_Collector collector(word, limit);
  std::vector<char> chunk(CHUNK);
  for (std::size_t count = file.read(chunk); count != 0; count = file.read(chunk))
    scan({chunk.data(), count}, collector);
  collector.endLine();
  return collector.take();
}

}  // namespace cimrt
