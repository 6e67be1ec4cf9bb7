#include "platform/linux/tessel/kernel_source.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <system_error>

#include "platform/linux/tessel/host_name.h"
#include "platform/linux/tessel/kernel_line.h"
#include "platform/linux/tessel/line_output.h"
#include "platform/linux/tessel/record_line.h"

namespace zal::tessel {
namespace {

/// A record is never longer, keys included; a shorter buffer gets an error in its place.
constexpr std::size_t kLargestRecord = 16384;

std::string trouble(const std::string& path) { return path + ": " + std::generic_category().message(errno); }

/// When the monotonic clock, which the records count by, stood at nothing. Sleep shifts it, as it does
/// for everybody who reads these records.
WallTime monotonicStart(const Clock& clock) {
  return clock.wallNow() - std::chrono::duration_cast<std::chrono::microseconds>(
                               std::chrono::steady_clock::now().time_since_epoch());
}

}  // namespace

KernelSource::KernelSource(Descriptor file, std::string path, const Clock& clock)
    : _file(std::move(file)), _path(std::move(path)), _clock(clock), _host(hostName()) {}

std::unique_ptr<KernelSource> KernelSource::open(const std::string& path, const Clock& clock,
                                                 std::string& trouble) {
  Descriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
  if (!file.isOpen()) {
    trouble = tessel::trouble(path);
    return nullptr;
  }
  return std::unique_ptr<KernelSource>(new KernelSource(std::move(file), path, clock));
}

std::optional<std::string> KernelSource::print(std::optional<WallTime> since, LineOutput& output) {
  End end{};
  return _printRest(since.value_or(WallTime::min()), output, end);
}

std::string KernelSource::follow(LineOutput& output) {
  // A pipe cannot seek; what lies in it is new.
  (void)::lseek(_file.get(), 0, SEEK_END);
  for (;;) {
    End end{};
    if (auto failed = _printRest(WallTime::min(), output, end)) return *failed;
    if (end == End::endOfFile) return _path + ": it has ended";
    pollfd waiting{_file.get(), POLLIN, 0};
    if (::poll(&waiting, 1, -1) < 0 && errno != EINTR) return trouble(_path);
  }
}

std::optional<std::string> KernelSource::_printRest(WallTime since, LineOutput& output, End& end) {
  std::array<char, kLargestRecord> buffer;
  const WallTime start = monotonicStart(_clock);
  for (;;) {
    const ssize_t count = ::read(_file.get(), buffer.data(), buffer.size());
    // Records that were overwritten meanwhile are gone; the next read has what is left.
    if (count < 0 && (errno == EINTR || errno == EPIPE)) continue;
    if (count <= 0) {
      end = count == 0 ? End::endOfFile : End::nothingMore;
      if (count == 0 || errno == EAGAIN) return std::nullopt;
      return trouble(_path);
    }
    _lines.add({buffer.data(), static_cast<std::size_t>(count)});
    while (const auto line = _lines.next()) {
      const auto message = parseKernelLine(*line);
      if (!message || start + message->sinceStart < since) continue;
      const Record record{start + message->sinceStart, _host, "kernel", "", message->text};
      if (!output.write(recordLine(record, _clock))) return output.trouble();
    }
  }
}

}  // namespace zal::tessel
