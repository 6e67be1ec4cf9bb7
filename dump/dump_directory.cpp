#include "dump/dump_directory.h"

#include <algorithm>
#include <string_view>

#include "platform/standard_path.h"
#include "session/text_encoding.h"

namespace zal {
namespace {

constexpr std::size_t kLongestFileName = 255;

/// As file names hold it: a NUL would end the path, and line breaks would break up whatever lists it.
std::string withoutControls(std::string_view text) {
  std::string name(text);
  std::replace_if(
      name.begin(), name.end(), [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == '\x7F'; },
      '_');
  return name;
}

/// The longest part of the beginning that has at most so many bytes and ends where a character does.
std::string_view bytePrefix(std::string_view text, std::size_t most) {
  if (text.size() <= most) return text;
  while (most > 0 && (static_cast<unsigned char>(text[most]) & 0xC0U) == 0x80U) --most;
  return text.substr(0, most);
}

/// Every part between slashes cut to a file name's length.
std::string fittingPath(std::string_view path) {
  std::string fitting;
  for (;;) {
    const std::size_t slash = path.find('/');
    fitting += bytePrefix(path.substr(0, slash), kLongestFileName);
    if (slash == std::string_view::npos) return fitting;
    fitting += '/';
    path.remove_prefix(slash + 1);
  }
}

/// The type with its last part cut so far that the ending, up to its first slash, fits behind it.
std::string namedAfter(std::string_view type, std::string_view ending) {
  const std::size_t endingBytes = std::min(ending.find('/'), ending.size());
  const std::size_t room = kLongestDumpName - std::min(kLongestDumpName, endingBytes);
  const std::size_t slash = type.rfind('/');
  const std::size_t start = slash == std::string_view::npos ? 0 : slash + 1;
  return fittingPath(type.substr(0, start)).append(bytePrefix(type.substr(start), room)).append(ending);
}

}  // namespace

std::optional<std::string> dumpDirectoryPath(const std::string& reportRoot, const std::string& home,
                                             const DumpRequest& request,
                                             const std::optional<std::string>& description) {
  const std::string type = withoutControls(request.sessionType);
  std::string ending = "-Log (" + request.dumpTimeText + ")";
  if (description && !trimmed(*description).empty()) {
    ending += " (" + withoutControls(utf16Prefix(*description, kDescriptionInName)) + ")";
  }
  const std::string joined = reportRoot + "/" + fittingPath(type) + "/" + namedAfter(type, ending);
  std::string path = standardizeBelowRoot(joined, reportRoot, home);
  const std::string root = resolveAndStandardize(reportRoot, home);
  if (!path.starts_with(root == "/" ? root : root + "/") || path.size() > kLongestDumpPath) {
    return std::nullopt;
  }
  // What differs is a link below the root.
  if (path != resolveAndStandardize(path, home)) return std::nullopt;
  return path;
}

}  // namespace zal
