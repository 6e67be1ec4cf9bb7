#include "session/line_file.h"

#include <cstddef>

#include <algorithm>
#include <system_error>

#include "session/fetch_soon.h"
#include "session/text_encoding.h"

namespace zal {

namespace {

// A stretch is cut here, so that it is still in the processor's cache when it is written.
constexpr std::ptrdiff_t kLargestStretch = 256 * 1024;
// Lines ahead that are asked for, and how far into them: most are not longer than two cache lines.
constexpr std::size_t kLinesAhead = 8;
constexpr std::size_t kCacheLine = 64;

}  // namespace

bool closeOrWarn(BufferedFile& file, const std::string& path, AgentLog& log) {
  const int error = file.close();
  if (error != 0) log.warning("Could not write " + path + ": " + std::generic_category().message(error));
  return error == 0;
}

std::string_view writtenPart(std::string_view line, bool isPlain) {
  const std::size_t units = isPlain ? line.size() : std::min(utf16Length(line), line.size());
  return {line.data(), units + 1};
}

bool writeStrings(const LogLines& strings, FilePlacement& files, const std::string& path, AgentLog& log) {
  BufferedFile file(files, path);
  // Neighbours in the file are mostly neighbours in the arena too, newline included; they go together.
  const bool plain = !strings.texts || strings.texts->isAscii();
  const char* begin = nullptr;
  const char* end = nullptr;
  for (std::size_t number = 0; number < strings.lines.size(); ++number) {
    const std::string_view line = strings.lines[number];
    const char* const later = strings.lines[std::min(number + kLinesAhead, strings.lines.size() - 1)].data();
    fetchSoon(later);
    fetchSoon(later, kCacheLine);
    const std::string_view part = writtenPart(line, plain);
    if (line.data() != end || end - begin >= kLargestStretch) {
      file.append({begin, static_cast<std::size_t>(end - begin)});
      if (file.failed()) break;
      begin = line.data();
    }
    end = part.data() + part.size();
  }
  file.append({begin, static_cast<std::size_t>(end - begin)});
  return closeOrWarn(file, path, log);
}

}  // namespace zal
