#include "platform/linux/config/file_signature.h"

#include <sys/stat.h>

#include <cerrno>

namespace zal {
namespace {

std::int64_t nanoseconds(const timespec& time) { return time.tv_sec * 1'000'000'000LL + time.tv_nsec; }

}  // namespace

FileSignature FileSignature::of(const std::string& path) {
  struct stat status {};
  FileSignature signature;
  if (::stat(path.c_str(), &status) != 0) {
    signature.error = errno;
    return signature;
  }
  signature.error = 0;
  signature.modified = nanoseconds(status.st_mtim);
  signature.changed = nanoseconds(status.st_ctim);
  signature.size = status.st_size;
  signature.inode = status.st_ino;
  return signature;
}

}  // namespace zal
