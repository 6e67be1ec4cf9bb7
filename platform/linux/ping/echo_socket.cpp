#include "platform/linux/ping/echo_socket.h"

#include <linux/errqueue.h>
#include <linux/icmp.h>
#include <netinet/icmp6.h>
#include <netinet/in.h>
#include <sys/random.h>
#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstring>

#include "platform/linux/files/system_error.h"
#include "platform/linux/ping/ping_text.h"

namespace zal {
namespace {

// One turn of the loop reads no more foreign packets than this; the rest waits for the next one.
constexpr int kForeignPacketsAtOnce = 64;

void switchOn(int socket, int level, int option) {
  const int on = 1;
  ::setsockopt(socket, level, option, &on, sizeof on);
}

template <typename Value>
Value valueOf(const cmsghdr& message) {
  Value value{};
  std::memcpy(&value, CMSG_DATA(&message), sizeof value);
  return value;
}

std::chrono::nanoseconds wallClock() { return std::chrono::system_clock::now().time_since_epoch(); }

std::chrono::nanoseconds durationOf(const timespec& time) {
  return std::chrono::seconds{time.tv_sec} + std::chrono::nanoseconds{time.tv_nsec};
}

asio::ip::address addressAt(const std::uint8_t* bytes, std::size_t size) {
  sockaddr_storage address{};
  std::memcpy(&address, bytes, std::min(size, sizeof address));
  return addressIn(reinterpret_cast<const sockaddr&>(address)).value_or(asio::ip::address());
}

}  // namespace

/// One packet or one entry of the error queue, with what the kernel told about it.
struct EchoSocket::Received {
  std::array<std::uint8_t, 2048> bytes{};
  std::size_t size = 0;
  asio::ip::address address;  ///< who sent it; for an error, where the request had gone
  std::optional<int> hops;
  std::chrono::nanoseconds waited{0};
  std::optional<sock_extended_err> error;
  asio::ip::address offender;

  [[nodiscard]] ByteView view() const { return ByteView(bytes).first(size); }
  void note(const cmsghdr& message);
};

void EchoSocket::Received::note(const cmsghdr& message) {
  const int level = message.cmsg_level, type = message.cmsg_type;
  if ((level == IPPROTO_IP && type == IP_TTL) || (level == IPPROTO_IPV6 && type == IPV6_HOPLIMIT)) {
    hops = valueOf<int>(message);
  } else if (level == SOL_SOCKET && type == SCM_TIMESTAMPNS) {
    waited = wallClock() - durationOf(valueOf<timespec>(message));
  } else if ((level == IPPROTO_IP && type == IP_RECVERR) || (level == IPPROTO_IPV6 && type == IPV6_RECVERR)) {
    error = valueOf<sock_extended_err>(message);
    const std::size_t start = CMSG_LEN(sizeof(sock_extended_err));
    if (message.cmsg_len > start) {
      offender = addressAt(CMSG_DATA(&message) + sizeof(sock_extended_err), message.cmsg_len - start);
    }
  }
}

EchoSocket::EchoSocket(EchoSocketKind kind, const asio::ip::address& peer, const std::string& interface,
                       BindingChoice choice, std::error_code& error)
    : _kind(kind), _peer(peer, 0) {
  const bool isV4 = peer.is_v4();
  const int type = kind == EchoSocketKind::datagram ? SOCK_DGRAM : SOCK_RAW;
  Descriptor socket(::socket(isV4 ? AF_INET : AF_INET6, type | SOCK_NONBLOCK | SOCK_CLOEXEC,
                             isV4 ? int{IPPROTO_ICMP} : int{IPPROTO_ICMPV6}));
  if (!socket.isOpen()) {
    error = lastSystemError();
    return;
  }
  const InterfaceBinding binding = bindToInterface(socket.get(), peer, interface, choice);
  error = binding.error;
  if (error) return;
  _socket = std::move(socket);
  _setOptions();
  // A datagram socket gets its id when it is bound; one bound to its source address has it already.
  if (kind == EchoSocketKind::datagram && !binding.byAddress) {
    const asio::ip::icmp::endpoint any(isV4 ? asio::ip::icmp::v4() : asio::ip::icmp::v6(), 0);
    if (::bind(_socket.get(), any.data(), static_cast<socklen_t>(any.size())) != 0) {
      error = lastSystemError();
      _socket = Descriptor();
      return;
    }
  }
  _takeIdentity();
}

void EchoSocket::_setOptions() {
  const int socket = _socket.get();
  switchOn(socket, SOL_SOCKET, SO_TIMESTAMPNS);
  if (_family() == IpFamily::v4) {
    switchOn(socket, IPPROTO_IP, IP_RECVERR);
    switchOn(socket, IPPROTO_IP, IP_RECVTTL);
    if (_kind == EchoSocketKind::raw) {
      icmp_filter filter{};
      filter.data = ~(1U << ICMP_ECHOREPLY);
      ::setsockopt(socket, SOL_RAW, ICMP_FILTER, &filter, sizeof filter);
    }
    return;
  }
  switchOn(socket, IPPROTO_IPV6, IPV6_RECVERR);
  switchOn(socket, IPPROTO_IPV6, IPV6_RECVHOPLIMIT);
  if (_kind == EchoSocketKind::raw) {
    icmp6_filter filter{};
    ICMP6_FILTER_SETBLOCKALL(&filter);
    ICMP6_FILTER_SETPASS(ICMP6_ECHO_REPLY, &filter);
    ::setsockopt(socket, IPPROTO_ICMPV6, ICMP6_FILTER, &filter, sizeof filter);
  }
}

void EchoSocket::_takeIdentity() {
  // Not enough randomness is no reason not to ping: a foreign answer is then likelier, no more.
  if (::getrandom(&_nonce, sizeof _nonce, GRND_NONBLOCK) != sizeof _nonce) {
    _nonce = static_cast<std::uint64_t>(wallClock().count());
  }
  _id = static_cast<std::uint16_t>(_nonce);
  if (_kind == EchoSocketKind::raw) return;
  sockaddr_storage own{};
  socklen_t length = sizeof own;
  if (::getsockname(_socket.get(), reinterpret_cast<sockaddr*>(&own), &length) != 0) return;
  std::uint16_t port = 0;  // stands at the same place in both families
  std::memcpy(&port, reinterpret_cast<const std::uint8_t*>(&own) + offsetof(sockaddr_in, sin_port),
              sizeof port);
  _id = ntohs(port);
}

std::error_code EchoSocket::send(std::uint16_t sequence) {
  const auto now = std::chrono::duration_cast<std::chrono::microseconds>(wallClock()).count();
  const auto data = makeEchoData(_nonce, static_cast<std::uint64_t>(now));
  const auto message = buildEchoRequest(_family(), _id, sequence, data);
  const auto trySend = [&] {
    const ssize_t sent = ::sendto(_socket.get(), message.data(), message.size(), MSG_NOSIGNAL, _peer.data(),
                                  static_cast<socklen_t>(_peer.size()));
    return sent < 0 ? lastSystemError() : std::error_code{};
  };
  // The first refusal may be the error of an earlier request, which the socket reports once.
  return trySend() ? trySend() : std::error_code{};
}

std::optional<EchoSocket::Received> EchoSocket::_read(int flags) {
  Received received;
  sockaddr_storage address{};
  alignas(cmsghdr) std::array<std::uint8_t, 512> control{};
  iovec part{received.bytes.data(), received.bytes.size()};
  msghdr header{};
  header.msg_name = &address;
  header.msg_namelen = sizeof address;
  header.msg_iov = &part;
  header.msg_iovlen = 1;
  header.msg_control = control.data();
  header.msg_controllen = control.size();
  ssize_t size = -1;
  do {
    size = ::recvmsg(_socket.get(), &header, flags | MSG_DONTWAIT);
  } while (size < 0 && errno == EINTR);
  if (size < 0) return std::nullopt;
  received.size = static_cast<std::size_t>(size);
  received.address = addressAt(reinterpret_cast<const std::uint8_t*>(&address), header.msg_namelen);
  for (const cmsghdr* message = CMSG_FIRSTHDR(&header); message != nullptr;
       message = CMSG_NXTHDR(&header, const_cast<cmsghdr*>(message))) {
    received.note(*message);
  }
  return received;
}

std::optional<EchoAnswer> EchoSocket::_answerIn(const Received& received) const {
  ByteView message = received.view();
  if (_kind == EchoSocketKind::raw && _family() == IpFamily::v4) {
    const auto inner = withoutIpv4Header(message);
    if (!inner) return std::nullopt;
    message = *inner;
  }
  const auto echo = parseEcho(_family(), message);
  if (!echo || !echo->isReply || echo->id != _id || !carriesNonce(echo->data, _nonce)) return std::nullopt;
  return EchoAnswer{received.address, echo->sequence, message.size(), received.hops, received.waited};
}

std::optional<EchoRefusal> EchoSocket::_refusalIn(const Received& received) const {
  if (!received.error) return std::nullopt;
  const auto echo = parseQuotedRequest(_family(), received.view());
  if (!echo || echo->id != _id || received.address != _peer.address()) return std::nullopt;
  const auto& error = *received.error;
  if (error.ee_origin == SO_EE_ORIGIN_ICMP || error.ee_origin == SO_EE_ORIGIN_ICMP6) {
    return EchoRefusal{received.offender, echo->sequence,
                       icmpErrorText(_family(), error.ee_type, error.ee_code)};
  }
  const auto reason = std::generic_category().message(static_cast<int>(error.ee_errno));
  return EchoRefusal{received.address, echo->sequence, "local error: " + reason};
}

std::optional<EchoEvent> EchoSocket::receive() {
  for (int i = 0; i < kForeignPacketsAtOnce; ++i) {
    if (const auto queued = _read(MSG_ERRQUEUE)) {
      if (auto refusal = _refusalIn(*queued)) return EchoEvent(std::move(*refusal));
      continue;
    }
    const auto received = _read(0);
    if (!received) {
      // A pending error is reported once in place of a packet, which may lie behind it.
      if (errno == EAGAIN || errno == EWOULDBLOCK) return std::nullopt;
      continue;
    }
    if (auto answer = _answerIn(*received)) return EchoEvent(std::move(*answer));
  }
  return std::nullopt;
}

}  // namespace zal
