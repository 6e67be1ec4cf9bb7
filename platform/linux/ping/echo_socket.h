#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <system_error>
#include <variant>
#include <vector>

#include <asio/ip/address.hpp>
#include <asio/ip/icmp.hpp>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/ping/icmp_packet.h"
#include "platform/linux/ping/interface_binding.h"

namespace zal {

/// An echo reply to a request of ours.
struct EchoAnswer {
  asio::ip::address from;
  std::uint16_t sequence = 0;
  std::size_t bytes = 0;               ///< of the ICMP message
  std::optional<int> hops;             ///< what is left of the hop limit
  std::chrono::nanoseconds waited{0};  ///< how long it lay in the kernel before we took it
};

/// An ICMP error about a request of ours, or the host's own refusal to send one.
struct EchoRefusal {
  asio::ip::address from;
  std::uint16_t sequence = 0;
  std::string text;  ///< "Destination Host Unreachable"
};

using EchoEvent = std::variant<EchoAnswer, EchoRefusal>;

enum class EchoSocketKind {
  datagram,  ///< needs no privilege where the host lets its groups ping
  raw,       ///< needs CAP_NET_RAW
};

/// A socket that sends echo requests to one peer over one interface and takes only what concerns
/// them: its id and nonce tell them from those of other programs. One thread; never blocks.
class EchoSocket {
 public:
  /// On failure the error says why and isOpen() is false.
  EchoSocket(EchoSocketKind kind, const asio::ip::address& peer, const std::string& interface,
             BindingChoice choice, std::error_code& error);

  [[nodiscard]] bool isOpen() const { return _socket.isOpen(); }
  /// For waiting until it can be read; stays owned here.
  [[nodiscard]] int descriptor() const { return _socket.get(); }
  [[nodiscard]] std::error_code send(std::uint16_t sequence);
  /// The next event that is there already, errors first; foreign packets are passed over.
  [[nodiscard]] std::optional<EchoEvent> receive();

 private:
  struct Received;
  [[nodiscard]] IpFamily _family() const { return _peer.address().is_v4() ? IpFamily::v4 : IpFamily::v6; }
  void _setOptions();
  void _takeIdentity();
  [[nodiscard]] std::optional<Received> _read(int flags);
  [[nodiscard]] std::optional<EchoAnswer> _answerIn(const Received& received) const;
  [[nodiscard]] std::optional<EchoRefusal> _refusalIn(const Received& received) const;

  EchoSocketKind _kind;
  asio::ip::icmp::endpoint _peer;
  Descriptor _socket;
  std::uint16_t _id = 0;
  std::uint64_t _nonce = 0;
};

}  // namespace zal
