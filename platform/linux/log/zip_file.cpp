#include "platform/linux/log/zip_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <zip.h>
#include <zlib.h>

#include <cerrno>
#include <ctime>
#include <memory>

#include "platform/linux/files/descriptor.h"

namespace zal {
namespace {

constexpr std::size_t kBlock = 64U << 10U;
// Log text shrinks to a tenth at the fastest level already; the machine has better things to do.
constexpr int kLevel = Z_BEST_SPEED;
constexpr unsigned long kMadeByUnix = (3U << 8U) | 20U;

std::error_code lastError() { return {errno != 0 ? errno : EIO, std::generic_category()}; }

zip_fileinfo entryInformation(const struct stat& status) {
  zip_fileinfo information{};
  tm local{};
  ::localtime_r(&status.st_mtime, &local);
  const auto part = [](int value) { return static_cast<uInt>(value); };
  information.tmz_date = {part(local.tm_sec),  part(local.tm_min), part(local.tm_hour),
                          part(local.tm_mday), part(local.tm_mon), part(local.tm_year + 1900)};
  information.external_fa = static_cast<uLong>(status.st_mode) << 16U;
  return information;
}

bool copyInto(zipFile archive, int source) {
  const auto block = std::make_unique<char[]>(kBlock);
  for (;;) {
    const ssize_t count = ::read(source, block.get(), kBlock);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return count == 0;
    if (zipWriteInFileInZip(archive, block.get(), static_cast<unsigned>(count)) != ZIP_OK) return false;
  }
}

bool pack(zipFile archive, int source, const zip_fileinfo& information, const std::string& entryName) {
  const int opened =
      zipOpenNewFileInZip4_64(archive, entryName.c_str(), &information, nullptr, 0, nullptr, 0, nullptr,
                              Z_DEFLATED, kLevel, 0, -MAX_WBITS, DEF_MEM_LEVEL, Z_DEFAULT_STRATEGY, nullptr,
                              0, kMadeByUnix, 1U << 11U /* the name is UTF-8 */, 0);
  if (opened != ZIP_OK) return false;
  const bool copied = copyInto(archive, source);
  return zipCloseFileInZip(archive) == ZIP_OK && copied;
}

std::error_code packIntoCreated(int source, const struct stat& status, const std::string& target,
                                const std::string& entryName) {
  errno = 0;
  zipFile archive = zipOpen64(target.c_str(), APPEND_STATUS_CREATE);
  if (archive == nullptr) return lastError();
  const bool packed = pack(archive, source, entryInformation(status), entryName);
  const std::error_code packError = packed ? std::error_code{} : lastError();
  if (zipClose(archive, nullptr) != ZIP_OK) return packError ? packError : lastError();
  return packError;
}

}  // namespace

std::error_code packIntoZip(int directory, const std::string& source, const std::string& target,
                            const std::string& entryName) {
  const Descriptor from(::openat(directory, source.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC | O_NONBLOCK));
  struct stat status {};
  if (from.get() < 0 || ::fstat(from.get(), &status) != 0) return lastError();
  // Made here for its mode, and kept open for the sync: the zip library knows neither.
  ::unlinkat(directory, target.c_str(), 0);
  const Descriptor to(
      ::openat(directory, target.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0640));
  if (to.get() < 0) return lastError();
  const std::string opened = "/proc/self/fd/" + std::to_string(to.get());
  std::error_code error = packIntoCreated(from.get(), status, opened, entryName);
  if (!error && ::fsync(to.get()) != 0) error = lastError();
  if (error) ::unlinkat(directory, target.c_str(), 0);
  return error;
}

}  // namespace zal
