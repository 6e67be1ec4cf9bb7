#include "platform/linux/blackbox/left_record.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <utility>

#include "platform/linux/blackbox/record_file.h"
#include "platform/linux/blackbox/record_frame.h"
#include "platform/linux/blackbox/record_window.h"

namespace zal {
namespace {

/// The endings of a record's name as it is tried and tried again; the last one is looked at no more.
constexpr std::array<std::string_view, 4> kEndings = {kRecordFileEnding, ".session.tried",
                                                      ".session.tried-twice", ".session.damaged"};
constexpr std::size_t kNumberLength = 32;

bool isNumber(std::string_view text) {
  return text.size() == kNumberLength && std::all_of(text.begin(), text.end(), [](char c) {
           return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f');
         });
}

}  // namespace

std::optional<LeftRecord> LeftRecord::take(const std::string& directory, const std::string& name,
                                           AgentLog& log) {
  const std::string_view ending = std::string_view(name).substr(std::min(kNumberLength, name.size()));
  const auto tried = std::find(kEndings.begin(), kEndings.end() - 1, ending);
  if (!isNumber(name.substr(0, kNumberLength)) || tried == kEndings.end() - 1) return std::nullopt;
  const std::string path = directory + "/" + name;
  Descriptor file(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
  struct stat status {};
  if (!file.isOpen() || ::fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode)) {
    log.warning("A record of the black box cannot be read: " + path);
    return std::nullopt;
  }
  if (::flock(file.get(), LOCK_EX | LOCK_NB) != 0) return std::nullopt;
  LeftRecord record(std::move(file), static_cast<std::uint64_t>(status.st_size), directory,
                    name.substr(0, kNumberLength));
  record._path = record._pathOf(std::string(*std::next(tried)));
  if (::rename(path.c_str(), record._path.c_str()) != 0) record._path = path;
  if (std::next(tried) != kEndings.end() - 1) return record;
  log.warning("The agent ended twice over a record of the black box; it is set aside as " + record._path);
  return std::nullopt;
}

LeftRecord::LeftRecord(Descriptor file, std::uint64_t size, std::string directory, std::string number)
    : _file(std::move(file)), _size(size), _directory(std::move(directory)), _number(std::move(number)) {}

std::string LeftRecord::_pathOf(const std::string& ending) const {
  return _directory + "/" + _number + ending;
}

void LeftRecord::_fill(std::uint64_t offset, char* buffer, std::size_t size) const {
  constexpr std::size_t kChunk = 64U << 10U;
  constexpr std::size_t kSector = 4096;
  for (std::size_t done = 0; done < size;) {
    const std::size_t wanted = std::min(kChunk, size - done);
    const auto at = static_cast<off_t>(offset + done);
    ssize_t count = ::pread(_file.get(), buffer + done, wanted, at);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) {
      // Smaller steps find where the medium gives way.
      const std::size_t step = std::min(kSector, wanted);
      count = ::pread(_file.get(), buffer + done, step, at);
      if (count <= 0) {
        std::fill_n(buffer + done, step, '\0');
        count = static_cast<ssize_t>(step);
      }
    }
    done += static_cast<std::size_t>(count);
  }
}

std::uint64_t LeftRecord::read(const std::function<void(std::string_view piece)>& handler) const {
  constexpr std::size_t kWindow = 1U << 20U;
  RecordWindow window(_size, kWindow, [this](std::uint64_t offset, char* buffer, std::size_t size) {
    _fill(offset, buffer, size);
  });
  return readRecordFrames(window, recordSeed(_number), handler);
}

void LeftRecord::remove() const { ::unlink(_path.c_str()); }

void LeftRecord::putBack() const {
  static_cast<void>(std::rename(_path.c_str(), _pathOf(std::string(kEndings[0])).c_str()));
}

}  // namespace zal
