#pragma once

#include <sys/resource.h>

#include <csignal>

namespace zal::testing {

/// While it lives no file of this process grows past so many bytes: writes fail half-way, for the
/// superuser too. Not for several threads.
class FileSizeLimit {
 public:
  explicit FileSizeLimit(rlim_t bytes) : _oldHandler(std::signal(SIGXFSZ, SIG_IGN)) {
    ::getrlimit(RLIMIT_FSIZE, &_old);
    const rlimit limit{bytes, _old.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &limit);
  }
  ~FileSizeLimit() {
    ::setrlimit(RLIMIT_FSIZE, &_old);
    std::signal(SIGXFSZ, _oldHandler);
  }
  FileSizeLimit(const FileSizeLimit&) = delete;
  FileSizeLimit& operator=(const FileSizeLimit&) = delete;

 private:
  rlimit _old{};
  void (*_oldHandler)(int);
};

}  // namespace zal::testing
