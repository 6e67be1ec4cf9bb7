#include "platform/linux/ping/interface_binding.h"

#include <ifaddrs.h>
#include <net/if.h>
#include <sys/socket.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <optional>

#include <asio/ip/udp.hpp>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

using asio::ip::udp;

bool isLinkLocal(const asio::ip::address& address) {
  return address.is_v6() && address.to_v6().is_link_local();
}

/// The interface's first address of the peer's family; link-local only for a link-local peer.
std::optional<asio::ip::address> ownAddress(const std::string& interface, const asio::ip::address& peer) {
  ifaddrs* list = nullptr;
  if (::getifaddrs(&list) != 0) return std::nullopt;
  const std::unique_ptr<ifaddrs, void (*)(ifaddrs*)> owner(list, ::freeifaddrs);
  for (const ifaddrs* entry = list; entry != nullptr; entry = entry->ifa_next) {
    if (interface != entry->ifa_name) continue;
    if (entry->ifa_addr == nullptr) continue;
    auto address = addressIn(*entry->ifa_addr);
    if (!address || address->is_v4() != peer.is_v4()) continue;
    if (isLinkLocal(*address) == isLinkLocal(peer)) return address;
  }
  return std::nullopt;
}

}  // namespace

std::optional<asio::ip::address> addressIn(const sockaddr& socketAddress) {
  const auto family = socketAddress.sa_family;
  if (family != AF_INET && family != AF_INET6) return std::nullopt;
  // The endpoint tells its size by what is in it already.
  udp::endpoint endpoint(family == AF_INET ? udp::v4() : udp::v6(), 0);
  std::memcpy(endpoint.data(), &socketAddress, endpoint.size());
  return endpoint.address();
}

InterfaceBinding bindToInterface(int socket, const asio::ip::address& peer, const std::string& interface,
                                 BindingChoice choice) {
  InterfaceBinding result;
  if (choice == BindingChoice::deviceFirst) {
    const auto length = static_cast<socklen_t>(interface.size());
    if (::setsockopt(socket, SOL_SOCKET, SO_BINDTODEVICE, interface.data(), length) == 0) return result;
    result.error = lastSystemError();
    if (result.error != std::errc::operation_not_permitted) return result;
  }
  const auto own = ownAddress(interface, peer);
  if (!own) {
    result.error = std::make_error_code(std::errc::address_not_available);
    return result;
  }
  const udp::endpoint endpoint(*own, 0);
  const int status = ::bind(socket, endpoint.data(), static_cast<socklen_t>(endpoint.size()));
  result.error = status == 0 ? std::error_code{} : lastSystemError();
  result.byAddress = true;
  result.sourceAddress = own->to_string();
  return result;
}

SourceProbe probeSource(const asio::ip::address& peer, const std::string& interface, BindingChoice choice) {
  constexpr unsigned short kAnyPort = 1025;  // nothing is sent
  SourceProbe probe;
  const Descriptor socket(::socket(peer.is_v4() ? AF_INET : AF_INET6, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!socket.isOpen()) {
    probe.error = lastSystemError();
    return probe;
  }
  const InterfaceBinding binding = bindToInterface(socket.get(), peer, interface, choice);
  probe.error = binding.error;
  probe.byAddress = binding.byAddress;
  if (probe.error) return probe;
  const udp::endpoint target(peer, kAnyPort);
  udp::endpoint source;
  auto length = static_cast<socklen_t>(source.capacity());
  if (::connect(socket.get(), target.data(), static_cast<socklen_t>(target.size())) != 0 ||
      ::getsockname(socket.get(), source.data(), &length) != 0) {
    probe.error = lastSystemError();
    return probe;
  }
  source.resize(length);
  probe.source = source.address();
  return probe;
}

}  // namespace zal
