#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include <asio/ip/address.hpp>

namespace zal {

/// One way out of an interface to everywhere.
struct DefaultRoute {
  std::optional<asio::ip::address> gateway;  ///< none on point-to-point links
  std::uint32_t metric = 0;
};

/// The default route of that interface with the lowest metric, from the kernel's text tables
/// (/proc/net/route, /proc/net/ipv6_route). Lines that make no sense are passed over.
[[nodiscard]] std::optional<DefaultRoute> defaultRouteV4(std::string_view table, std::string_view interface);
[[nodiscard]] std::optional<DefaultRoute> defaultRouteV6(std::string_view table, std::string_view interface);

/// The same from the tables of this moment, version 4 before version 6, and a route with a gateway
/// before one without. A link-local gateway carries the interface as its scope.
[[nodiscard]] std::optional<DefaultRoute> currentDefaultRoute(const std::string& interface);

}  // namespace zal
