#include "platform/linux/helper/dump_files.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/linux/files/escaped_text.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"

namespace zal::helper {
namespace {

/// Removes the half-written file unless it got its name.
class Unfinished {
 public:
  explicit Unfinished(std::string path) : _path(std::move(path)) {}
  ~Unfinished() { ::unlink(_path.c_str()); }
  Unfinished(const Unfinished&) = delete;
  Unfinished& operator=(const Unfinished&) = delete;

 private:
  const std::string _path;
};

struct Copied {
  std::uint64_t bytes = 0;
  std::string trouble;  ///< why it is not all
};

Copied copyPortions(int source, int target, std::uint64_t mostBytes, Patience& patience) {
  Copied copied;
  std::array<char, 65536> buffer;
  for (;;) {
    if (patience.isOver()) {
      copied.trouble = "cut off: " + patience.reason();
      return copied;
    }
    const ssize_t got = ::read(source, buffer.data(), buffer.size());
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) copied.trouble = lastSystemError().message();
    if (got <= 0) return copied;
    const std::uint64_t room = mostBytes - copied.bytes;
    const auto portion = std::min(room, static_cast<std::uint64_t>(got));
    if (const auto error = writeWhole(target, {buffer.data(), static_cast<std::size_t>(portion)})) {
      copied.trouble = "cannot be written: " + error.message();
      return copied;
    }
    copied.bytes += portion;
    if (portion < static_cast<std::uint64_t>(got)) {
      copied.trouble = "cut at " + std::to_string(mostBytes) + " bytes";
      return copied;
    }
  }
}

std::string withRemark(std::string line, const std::string& remark) {
  if (!remark.empty()) line += " (" + escapedLine(remark) + ")";
  return line;
}

std::string firstLine(const std::string& text) { return text.substr(0, text.find('\n')); }

}  // namespace

DumpFiles::DumpFiles(std::string directory, std::string prefix)
    : _directory(std::move(directory)),
      _prefix(std::move(prefix)),
      _opened(::open(_directory.c_str(), O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC)),
      _trouble(_opened.isOpen() ? std::error_code() : lastSystemError()) {}

/// By the handle, in the words of a path.
std::string DumpFiles::_at(const std::string& fileName) const {
  return "/proc/self/fd/" + std::to_string(_opened.get()) + "/" + fileName;
}

void DumpFiles::_fail(const std::string& name, const std::string& reason) {
  _hasFailed = true;
  _lines.push_back(name + ": cannot be written: " + escapedLine(reason));
}

bool DumpFiles::_place(const std::string& name, std::string_view content) {
  const auto error =
      _trouble ? _trouble : placeWholeFile(_at(_prefix + name), content, ExistingFile::isReplaced);
  if (error) _fail(name, error.message());
  return !error;
}

void DumpFiles::write(const std::string& name, std::string_view content, const std::string& remark) {
  if (!_place(name, content)) return;
  _gaveSomething = true;
  _lines.push_back(withRemark(name + ": " + std::to_string(content.size()) + " bytes", remark));
}

void DumpFiles::writeOutcome(const std::string& name, const std::string& source,
                             const ProgramOutcome& outcome, bool withErrors) {
  const std::string said = firstLine(outcome.errors);
  std::string why = outcome.trouble;
  if (!why.empty() && !said.empty()) why += ": " + said;
  const bool isEmpty = outcome.output.empty();
  if (!isEmpty) {
    std::string text = outcome.output;
    if (withErrors && !outcome.errors.empty()) text += outcome.errors;
    if (withErrors && !outcome.trouble.empty()) text += "(" + source + ": " + outcome.trouble + ")\n";
    write(name, text, why);
    return;
  }
  if (why.empty()) why = said.empty() ? "said nothing" : "said nothing but: " + said;
  if (withErrors) (void)_place(name, "(" + source + ": " + why + ")\n");
  missing(source, why);
}

bool DumpFiles::copy(const std::string& name, const std::string& source, std::uint64_t mostBytes,
                     Patience& patience) {
  const Descriptor from(::open(source.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
  if (!from.isOpen()) {
    missing(source, lastSystemError().message());
    return false;
  }
  if (_trouble) {
    _fail(name, _trouble.message());
    return false;
  }
  const std::string temporary = _at(".new-" + std::to_string(::getpid()) + "-copy");
  const Descriptor to(::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC, 0600));
  if (!to.isOpen()) {
    _fail(name, lastSystemError().message());
    return false;
  }
  const Unfinished guard(temporary);
  const Copied copied = copyPortions(from.get(), to.get(), mostBytes, patience);
  if (copied.bytes == 0) {
    missing(source, copied.trouble.empty() ? "is empty" : copied.trouble);
    return false;
  }
  if (::rename(temporary.c_str(), _at(_prefix + name).c_str()) != 0) {
    _fail(name, lastSystemError().message());
    return false;
  }
  _gaveSomething = true;
  _lines.push_back(
      withRemark(name + ": " + std::to_string(copied.bytes) + " bytes of " + source, copied.trouble));
  return true;
}

void DumpFiles::missing(const std::string& source, const std::string& reason) {
  _lines.push_back("not had: " + escapedLine(source) + ": " + escapedLine(reason));
}

void DumpFiles::writeNote(const std::string& name, const std::string& reason, const Patience& patience) {
  std::string text = "reason: " + escapedLine(reason) + "\n";
  if (!patience.reason().empty()) text += "cut short: " + patience.reason() + "\n";
  for (const std::string& line : _lines) text += line + "\n";
  (void)_place(name, text);
}

}  // namespace zal::helper
