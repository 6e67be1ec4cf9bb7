#include "examples/loopback_call/media_endpoint.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <system_error>

namespace loopback {

namespace {

sockaddr_in loopbackAddress(std::uint16_t port) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  address.sin_port = htons(port);
  return address;
}

[[noreturn]] void fail(const char* what) { throw std::system_error(errno, std::generic_category(), what); }

}  // namespace

std::uint64_t steadyNanoseconds() {
  return static_cast<std::uint64_t>(
      std::chrono::nanoseconds(std::chrono::steady_clock::now().time_since_epoch()).count());
}

MediaEndpoint::MediaEndpoint(std::uint32_t source)
    : _socket(::socket(AF_INET, SOCK_DGRAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0)), _source(source) {
  if (_socket < 0) fail("UDP socket");
  sockaddr_in address = loopbackAddress(0);
  socklen_t size = sizeof address;
  if (::bind(_socket, reinterpret_cast<const sockaddr*>(&address), size) != 0 ||
      ::getsockname(_socket, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
    ::close(_socket);
    fail("UDP port on the loopback interface");
  }
  _port = ntohs(address.sin_port);
}

MediaEndpoint::~MediaEndpoint() { ::close(_socket); }

std::string MediaEndpoint::address() const { return "127.0.0.1:" + std::to_string(_port); }

void MediaEndpoint::callTo(const MediaEndpoint& other) {
  const sockaddr_in address = loopbackAddress(other._port);
  if (::connect(_socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) fail("UDP peer");
}

void MediaEndpoint::sendPacket() {
  MediaPacket packet;
  packet.sequence = static_cast<std::uint16_t>(_sent);
  packet.mediaTimestamp = static_cast<std::uint32_t>(_sent * kAudioBytes);
  packet.source = _source;
  packet.sentAt = steadyNanoseconds();
  _statistics.echoInto(packet, packet.sentAt);
  ++_sent;
  const auto bytes = encode(packet);
  // A packet that the host does not take is a lost packet: the other side's count shows it.
  [[maybe_unused]] const auto ignored = ::send(_socket, bytes.data(), bytes.size(), 0);
}

void MediaEndpoint::receivePackets() {
  std::array<std::byte, 2048> buffer;
  for (;;) {
    const auto size = ::recv(_socket, buffer.data(), buffer.size(), 0);
    if (size < 0) return;
    const std::uint64_t now = steadyNanoseconds();
    if (const auto packet = decode(std::span(buffer).first(static_cast<std::size_t>(size)))) {
      _statistics.received(*packet, now);
    }
  }
}

}  // namespace loopback
