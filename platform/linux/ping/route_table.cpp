#include "platform/linux/ping/route_table.h"

#include <net/if.h>
#include <net/route.h>

#include <charconv>
#include <cstring>
#include <string>
#include <vector>

#include "platform/linux/files/readable_text.h"

namespace zal {
namespace {

// The thread's own view: a thread may live in another network namespace than its process.
constexpr const char* kTableV4 = "/proc/thread-self/net/route";
constexpr const char* kTableV6 = "/proc/thread-self/net/ipv6_route";

std::vector<std::string_view> fieldsOf(std::string_view line) {
  constexpr std::string_view kBlanks = " \t";
  std::vector<std::string_view> fields;
  for (std::size_t at = line.find_first_not_of(kBlanks); at != std::string_view::npos;
       at = line.find_first_not_of(kBlanks, at)) {
    const std::size_t end = std::min(line.find_first_of(kBlanks, at), line.size());
    fields.push_back(line.substr(at, end - at));
    at = end;
  }
  return fields;
}

template <typename Visit>
void forEachLine(std::string_view table, Visit visit) {
  while (!table.empty()) {
    const std::size_t end = std::min(table.find('\n'), table.size());
    visit(fieldsOf(table.substr(0, end)));
    table.remove_prefix(std::min(end + 1, table.size()));
  }
}

std::optional<std::uint32_t> number(std::string_view text, int base) {
  std::uint32_t value = 0;
  const auto result = std::from_chars(text.data(), text.data() + text.size(), value, base);
  if (result.ec != std::errc{} || result.ptr != text.data() + text.size()) return std::nullopt;
  return value;
}

std::optional<asio::ip::address_v6> addressV6(std::string_view hex) {
  asio::ip::address_v6::bytes_type bytes{};
  if (hex.size() != bytes.size() * 2) return std::nullopt;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    const auto byte = number(hex.substr(i * 2, 2), 16);
    if (!byte) return std::nullopt;
    bytes[i] = static_cast<unsigned char>(*byte);
  }
  return asio::ip::address_v6(bytes);
}

void keepBetter(std::optional<DefaultRoute>& best, const DefaultRoute& candidate) {
  if (!best || candidate.metric < best->metric) best = candidate;
}

bool usable(std::uint32_t flags) { return (flags & RTF_UP) != 0 && (flags & RTF_REJECT) == 0; }

}  // namespace

// Iface Destination Gateway Flags RefCnt Use Metric Mask MTU Window IRTT
std::optional<DefaultRoute> defaultRouteV4(std::string_view table, std::string_view interface) {
  std::optional<DefaultRoute> best;
  forEachLine(table, [&](const std::vector<std::string_view>& fields) {
    if (fields.size() < 8 || fields[0] != interface) return;
    const auto destination = number(fields[1], 16), gateway = number(fields[2], 16),
               flags = number(fields[3], 16), metric = number(fields[6], 10), mask = number(fields[7], 16);
    if (!destination || !gateway || !flags || !metric || !mask) return;
    if (*destination != 0 || *mask != 0 || !usable(*flags)) return;
    DefaultRoute route{std::nullopt, *metric};
    if ((*flags & RTF_GATEWAY) != 0) {
      // The number's bytes in memory are the address as it goes over the wire.
      asio::ip::address_v4::bytes_type bytes{};
      std::memcpy(bytes.data(), &*gateway, bytes.size());
      route.gateway = asio::ip::address_v4(bytes);
    }
    keepBetter(best, route);
  });
  return best;
}

// destination prefix source prefix gateway metric refcount use flags interface
std::optional<DefaultRoute> defaultRouteV6(std::string_view table, std::string_view interface) {
  std::optional<DefaultRoute> best;
  forEachLine(table, [&](const std::vector<std::string_view>& fields) {
    if (fields.size() < 10 || fields[9] != interface) return;
    const auto destination = addressV6(fields[0]), gateway = addressV6(fields[4]);
    const auto prefix = number(fields[1], 16), metric = number(fields[5], 16), flags = number(fields[8], 16);
    if (!destination || !gateway || !prefix || !metric || !flags) return;
    if (!destination->is_unspecified() || *prefix != 0 || !usable(*flags)) return;
    DefaultRoute route{std::nullopt, *metric};
    if ((*flags & RTF_GATEWAY) != 0) route.gateway = *gateway;
    keepBetter(best, route);
  });
  return best;
}

std::optional<DefaultRoute> currentDefaultRoute(const std::string& interface) {
  auto v4 = defaultRouteV4(readableText(kTableV4), interface);
  if (v4 && v4->gateway) return v4;
  auto v6 = defaultRouteV6(readableText(kTableV6), interface);
  if (!v6 || !v6->gateway) return v4 ? v4 : v6;
  asio::ip::address_v6 gateway = v6->gateway->to_v6();
  if (gateway.is_link_local()) gateway.scope_id(::if_nametoindex(interface.c_str()));
  v6->gateway = gateway;
  return v6;
}

}  // namespace zal
