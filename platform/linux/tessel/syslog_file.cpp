#include "platform/linux/tessel/syslog_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <vector>

namespace zal::tessel {

SyslogFile::SyslogFile(const std::string& path)
    : _file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {
  struct stat status {};
  // A directory opens as well, and a pipe never has an end to look back from.
  if (_file.isOpen() && (::fstat(_file.get(), &status) != 0 || !S_ISREG(status.st_mode))) {
    _file = Descriptor();
    errno = EINVAL;
  }
}

std::optional<bool> SyslogFile::isAt(const std::string& path) const {
  struct stat named {};
  struct stat own {};
  if (::stat(path.c_str(), &named) != 0 || ::fstat(_file.get(), &own) != 0) return std::nullopt;
  return named.st_dev == own.st_dev && named.st_ino == own.st_ino;
}

void SyslogFile::skipToEnd() {
  const off_t end = ::lseek(_file.get(), 0, SEEK_END);
  char last = '\n';
  if (end > 0 && ::pread(_file.get(), &last, 1, end - 1) == 1 && last != '\n') _lines.skipBrokenLine();
}

bool SyslogFile::readLines(const OnLine& onLine) {
  struct stat status {};
  const off_t at = ::lseek(_file.get(), 0, SEEK_CUR);
  if (::fstat(_file.get(), &status) == 0 && status.st_size < at) {
    (void)_lines.takeRest();
    ::lseek(_file.get(), 0, SEEK_SET);
  }
  std::vector<char> buffer(64U << 10U);
  for (;;) {
    const ssize_t count = ::read(_file.get(), buffer.data(), buffer.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return true;
    _lines.add({buffer.data(), static_cast<std::size_t>(count)});
    while (const auto line = _lines.next()) {
      if (!onLine(*line)) return false;
    }
  }
}

}  // namespace zal::tessel
