#pragma once

#include <sys/socket.h>

#include <optional>
#include <string>
#include <system_error>

#include <asio/ip/address.hpp>

#include "platform/linux/ping/icmp_packet.h"

namespace zal {

/// The address in a whole socket address; nothing for other families than version 4 and 6.
[[nodiscard]] std::optional<asio::ip::address> addressIn(const sockaddr& socketAddress);

/// How a socket came to use one interface only.
struct InterfaceBinding {
  std::error_code error;      ///< why it does not
  bool byAddress = false;     ///< by its source address: the kernel may still route around the interface
  std::string sourceAddress;  ///< what it was bound to, when by address
};

enum class BindingChoice { deviceFirst, addressOnly };

/// Binds the socket to the interface, or to the interface's own address where the kernel does not
/// permit that. The peer decides which of several version 6 addresses fits.
[[nodiscard]] InterfaceBinding bindToInterface(int socket, const asio::ip::address& peer,
                                               const std::string& interface, BindingChoice choice);

/// What the kernel says to a way from the interface to the peer, asked without sending anything:
/// the source address that packets would carry, or the error that a sender would meet.
struct SourceProbe {
  std::error_code error;
  asio::ip::address source;
  bool byAddress = false;
};
[[nodiscard]] SourceProbe probeSource(const asio::ip::address& peer, const std::string& interface,
                                      BindingChoice choice);

}  // namespace zal
