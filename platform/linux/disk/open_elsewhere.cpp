#include "platform/linux/disk/open_elsewhere.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>
#include <csignal>

namespace zal {

bool isOpenElsewhere(int file) {
  if (::flock(file, LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK) return true;
  // The kernel gives this lease to the only one who has the file open. Whoever opens it in the moment until
  // it is given back makes the kernel send a signal: one that nobody minds.
  ::fcntl(file, F_SETSIG, SIGURG);
  const bool isOpen = ::fcntl(file, F_SETLEASE, F_WRLCK) != 0 && errno == EAGAIN;
  ::fcntl(file, F_SETLEASE, F_UNLCK);
  ::flock(file, LOCK_UN);
  return isOpen;
}

}  // namespace zal
