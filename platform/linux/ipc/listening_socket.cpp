#include "platform/linux/ipc/listening_socket.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <system_error>
#include <utility>

#include "platform/linux/ipc/access_policy.h"

namespace zal {
namespace {

constexpr mode_t kSocketMode = 0660;
constexpr int kFirstPassed = 3;
constexpr int kMostPassed = 1024;

std::string errorText(int error) { return std::generic_category().message(error); }

std::optional<sockaddr_un> addressOf(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.empty() || path.size() >= sizeof address.sun_path) return std::nullopt;
  std::memcpy(address.sun_path, path.data(), path.size());
  return address;
}

const sockaddr* generic(const sockaddr_un& address) { return reinterpret_cast<const sockaddr*>(&address); }

/// What a connection to the file tells about who listens there.
struct Holder {
  int error = 0;      // 0: somebody answered
  pid_t process = 0;  // 0: not known
};

Holder holderOf(const sockaddr_un& address) {
  const Descriptor probe(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  if (!probe.isOpen()) return {errno, 0};
  // A full backlog (EAGAIN) is an agent too, one that is busy.
  if (::connect(probe.get(), generic(address), sizeof address) != 0 && errno != EAGAIN) return {errno, 0};
  const auto credentials = peerCredentials(probe.get());
  return {0, credentials ? credentials->process : 0};
}

std::string heldBy(const std::string& path, pid_t process) {
  return path + " is held by " + (process > 0 ? "process " + std::to_string(process) : "another process");
}

pid_t processWrittenIn(int lock) {
  char text[16] = {};
  const auto size = ::pread(lock, text, sizeof text, 0);
  pid_t process = 0;
  if (size > 0) std::from_chars(text, text + size, process);
  return process;
}

void writeProcess(int lock) {
  const std::string text = std::to_string(::getpid()) + "\n";
  // Only read to name the holder in a warning; without it the warning names none.
  if (::ftruncate(lock, 0) == 0) static_cast<void>(::pwrite(lock, text.data(), text.size(), 0) == 0);
}

/// Open, and empty `trouble`, when the lock was had.
Descriptor lockFor(const std::string& path, const sockaddr_un& address, std::string& trouble) {
  const std::string name = path + ".lock";
  Descriptor lock(::open(name.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
  if (!lock.isOpen()) {
    trouble = "cannot open " + name + ": " + errorText(errno);
    return {};
  }
  if (::flock(lock.get(), LOCK_EX | LOCK_NB) == 0) {
    writeProcess(lock.get());
    return lock;
  }
  const Holder holder = holderOf(address);
  trouble = heldBy(path, holder.process > 0 ? holder.process : processWrittenIn(lock.get()));
  return {};
}

/// Whether the name is free now, a dead agent's socket file removed.
bool clearName(const std::string& path, const sockaddr_un& address, std::string& trouble) {
  struct stat status {};
  if (::lstat(path.c_str(), &status) != 0) {
    if (errno == ENOENT) return true;
    trouble = "cannot look at " + path + ": " + errorText(errno);
  } else if (!S_ISSOCK(status.st_mode)) {
    trouble = path + " is there and is no socket";
  } else if (const Holder holder = holderOf(address); holder.error == 0) {
    trouble = heldBy(path, holder.process);
  } else if (holder.error != ECONNREFUSED) {
    trouble = "cannot tell who holds " + path + ": " + errorText(holder.error);
  } else if (::unlink(path.c_str()) != 0 && errno != ENOENT) {
    trouble = "cannot remove the stale " + path + ": " + errorText(errno);
  }
  return trouble.empty();
}

bool isListeningUnixStream(int socket) {
  const auto option = [socket](int name) {
    int value = -1;
    socklen_t size = sizeof value;
    return ::getsockopt(socket, SOL_SOCKET, name, &value, &size) == 0 ? value : -1;
  };
  return option(SO_DOMAIN) == AF_UNIX && option(SO_TYPE) == SOCK_STREAM && option(SO_ACCEPTCONN) == 1;
}

std::optional<int> numberIn(const char* variable) {
  const char* text = std::getenv(variable);
  if (text == nullptr) return std::nullopt;
  int number = 0;
  const auto result = std::from_chars(text, text + std::strlen(text), number);
  return result.ec == std::errc() && *result.ptr == '\0' ? std::optional(number) : std::nullopt;
}

}  // namespace

std::optional<ListeningSocket> ListeningSocket::bindPath(const std::string& path, std::optional<gid_t> group,
                                                         std::string& trouble) {
  trouble.clear();
  const auto address = addressOf(path);
  if (!address) {
    trouble = "socket path of " + std::to_string(path.size()) + " bytes; 1 to 107 are possible: " + path;
    return std::nullopt;
  }
  ListeningSocket made;
  made._lock = lockFor(path, *address, trouble);
  if (!made._lock.isOpen() || !clearName(path, *address, trouble)) return std::nullopt;

  made._socket = Descriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  // The file is born with the mode of the unbound socket: nobody else can connect before it has its
  // group, whatever the process's mask for new files says.
  if (!made._socket.isOpen() || ::fchmod(made._socket.get(), 0600) != 0 ||
      ::bind(made._socket.get(), generic(*address), sizeof *address) != 0) {
    trouble = "cannot bind " + path + ": " + errorText(errno);
    return std::nullopt;
  }
  struct stat status {};
  if (::lstat(path.c_str(), &status) == 0) {
    made._path = path;
    made._device = status.st_dev;
    made._inode = status.st_ino;
  }
  // Without the right to give the file away, members of the group reach it only as the directory
  // and its owner arrange it.
  if (group && ::lchown(path.c_str(), static_cast<uid_t>(-1), *group) != 0 && errno != EPERM) {
    trouble = "cannot give " + path + " to its group: " + errorText(errno);
    return std::nullopt;
  }
  if (::chmod(path.c_str(), kSocketMode) != 0 || ::listen(made._socket.get(), SOMAXCONN) != 0) {
    trouble = "cannot listen at " + path + ": " + errorText(errno);
    return std::nullopt;
  }
  return made;
}

std::optional<ListeningSocket> ListeningSocket::adopt(Descriptor passed, std::string& trouble) {
  trouble.clear();
  if (!isListeningUnixStream(passed.get())) {
    trouble = "the descriptor passed by the service manager is no listening Unix stream socket";
    return std::nullopt;
  }
  const int flags = ::fcntl(passed.get(), F_GETFL);
  if (flags < 0 || ::fcntl(passed.get(), F_SETFL, flags | O_NONBLOCK) != 0) {
    trouble = "cannot use the descriptor passed by the service manager: " + errorText(errno);
    return std::nullopt;
  }
  ListeningSocket made;
  made._socket = std::move(passed);
  return made;
}

ListeningSocket::ListeningSocket(ListeningSocket&& other) noexcept
    : _lock(std::move(other._lock)),
      _socket(std::move(other._socket)),
      _path(std::exchange(other._path, {})),
      _device(other._device),
      _inode(other._inode) {}

ListeningSocket::~ListeningSocket() {
  struct stat status {};
  if (_path.empty() || ::lstat(_path.c_str(), &status) != 0) return;
  if (status.st_dev == _device && status.st_ino == _inode) ::unlink(_path.c_str());
}

Descriptor takePassedListener() {
  const auto process = numberIn("LISTEN_PID");
  const int count = std::min(numberIn("LISTEN_FDS").value_or(0), kMostPassed);
  for (const char* variable : {"LISTEN_PID", "LISTEN_FDS", "LISTEN_FDNAMES"}) ::unsetenv(variable);
  if (process != ::getpid() || count < 1) return {};
  for (int extra = kFirstPassed + 1; extra < kFirstPassed + count; ++extra) ::close(extra);
  const int flags = ::fcntl(kFirstPassed, F_GETFD);
  if (flags >= 0) ::fcntl(kFirstPassed, F_SETFD, flags | FD_CLOEXEC);
  return Descriptor(kFirstPassed);
}

}  // namespace zal
