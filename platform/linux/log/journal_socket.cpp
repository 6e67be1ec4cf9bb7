#include "platform/linux/log/journal_socket.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>

namespace zal {
namespace {

/// The kernel refuses larger datagrams, and holds no more than this for a journal that is behind.
constexpr int kSendBuffer = 1 << 20;
/// More in one system call save nothing that could be measured.
constexpr std::size_t kBatch = 32;

JournalSocket::Stop stopOf(int error) {
  switch (error) {
    case EAGAIN:
    case ENOBUFS:
    case ENOMEM:
    case ETOOMANYREFS:
      return JournalSocket::Stop::full;
    case EMSGSIZE:
      return JournalSocket::Stop::tooLarge;
    case ECONNREFUSED:
    case ECONNRESET:
    case ENOTCONN:
    case EPIPE:
      return JournalSocket::Stop::gone;
    default:
      return JournalSocket::Stop::refused;
  }
}

/// The kernel's picture of some datagrams.
class Batch {
 public:
  explicit Batch(std::span<const JournalDatagram> datagrams) : _count(std::min(datagrams.size(), kBatch)) {
    for (std::size_t i = 0; i < _count; ++i) _set(i, datagrams[i]);
  }
  Batch(const Batch&) = delete;
  Batch& operator=(const Batch&) = delete;

  /// How many went, or -1 with the reason in errno.
  int send(int socket) {
    return ::sendmmsg(socket, _messages.data(), static_cast<unsigned>(_count), MSG_DONTWAIT | MSG_NOSIGNAL);
  }

 private:
  struct Control {
    alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(int))> bytes;
  };

  void _set(std::size_t place, const JournalDatagram& datagram) {
    msghdr& header = _messages[place].msg_hdr;
    header = {};
    if (datagram.memory < 0) {
      _bytes[place] = {const_cast<char*>(datagram.bytes.data()), datagram.bytes.size()};
      header.msg_iov = &_bytes[place];
      header.msg_iovlen = 1;
      return;
    }
    _controls[place].bytes.fill(0);
    header.msg_control = _controls[place].bytes.data();
    header.msg_controllen = _controls[place].bytes.size();
    cmsghdr* const control = CMSG_FIRSTHDR(&header);
    control->cmsg_level = SOL_SOCKET;
    control->cmsg_type = SCM_RIGHTS;
    control->cmsg_len = CMSG_LEN(sizeof(int));
    std::memcpy(CMSG_DATA(control), &datagram.memory, sizeof(int));
  }

  std::size_t _count;
  std::array<mmsghdr, kBatch> _messages;
  std::array<iovec, kBatch> _bytes;
  std::array<Control, kBatch> _controls;
};

}  // namespace

bool JournalSocket::connect(const std::string& path) {
  close();
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) return false;
  std::copy(path.begin(), path.end(), address.sun_path);
  Descriptor socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  if (!socket.isOpen()) return false;
  if (::connect(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) return false;
  // Without it the kernel holds fewer; it still works.
  ::setsockopt(socket.get(), SOL_SOCKET, SO_SNDBUF, &kSendBuffer, sizeof kSendBuffer);
  _socket = std::move(socket);
  return true;
}

JournalSocket::Sent JournalSocket::send(std::span<const JournalDatagram> datagrams) {
  std::size_t count = 0;
  while (count < datagrams.size()) {
    Batch batch(datagrams.subspan(count));
    const int sent = batch.send(_socket.get());
    if (sent > 0) {
      count += static_cast<std::size_t>(sent);
    } else if (sent == 0 || errno != EINTR) {
      const Stop stop = sent == 0 ? Stop::full : stopOf(errno);
      if (stop == Stop::gone) close();
      return {count, stop};
    }
  }
  return {count, Stop::none};
}

}  // namespace zal
