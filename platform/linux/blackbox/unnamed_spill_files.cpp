#include "platform/linux/blackbox/unnamed_spill_files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/private_directory.h"

namespace zal {
namespace {

class UnnamedSpillFile final : public SpillFile {
 public:
  explicit UnnamedSpillFile(std::string directory) : _directory(std::move(directory)) {}

  bool append(std::string_view bytes) override {
    if (!_open()) return false;
    std::uint64_t end = _size;
    while (!bytes.empty()) {
      const ssize_t count = ::pwrite(_file.get(), bytes.data(), bytes.size(), static_cast<off_t>(end));
      if (count < 0 && errno == EINTR) continue;
      if (count <= 0) {
        _error = count < 0 ? errno : ENOSPC;
        // The room may serve somebody else meanwhile.
        static_cast<void>(::ftruncate(_file.get(), static_cast<off_t>(_size)) == 0);
        return false;
      }
      end += static_cast<std::uint64_t>(count);
      bytes.remove_prefix(static_cast<std::size_t>(count));
    }
    _size = end;
    return true;
  }

  [[nodiscard]] std::uint64_t size() const override { return _size; }

  bool read(std::uint64_t offset, char* buffer, std::size_t size) override {
    while (size > 0) {
      const ssize_t count = ::pread(_file.get(), buffer, size, static_cast<off_t>(offset));
      if (count < 0 && errno == EINTR) continue;
      if (count <= 0) {
        _error = count < 0 ? errno : EIO;
        return false;
      }
      offset += static_cast<std::uint64_t>(count);
      buffer += count;
      size -= static_cast<std::size_t>(count);
    }
    return true;
  }

  [[nodiscard]] std::string trouble() const override {
    return _directory + ": " + std::generic_category().message(_error);
  }

 private:
  bool _open() {
    if (_file.isOpen()) return true;
    errno = 0;
    if (!ensurePrivateDirectory(_directory)) {
      _error = errno != 0 ? errno : EACCES;
      return false;
    }
    _file =
        Descriptor(::open(_directory.c_str(), O_TMPFILE | O_EXCL | O_RDWR | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (_file.isOpen()) return true;
    _error = errno;
    return _error == EOPNOTSUPP && _openAndUnlink();
  }

  /// For file systems that know no files without a name.
  bool _openAndUnlink() {
    const std::string path = _directory + "/" + randomName() + ".lines";
    _file = Descriptor(
        ::open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!_file.isOpen()) {
      _error = errno;
      return false;
    }
    ::unlink(path.c_str());
    return true;
  }

  const std::string _directory;
  Descriptor _file;
  std::uint64_t _size = 0;
  int _error = 0;
};

}  // namespace

std::unique_ptr<SpillFile> UnnamedSpillFiles::make() {
  return std::make_unique<UnnamedSpillFile>(_directory);
}

}  // namespace zal
