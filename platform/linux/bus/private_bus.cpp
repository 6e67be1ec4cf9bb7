#include "platform/linux/bus/private_bus.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <string_view>

#include "platform/linux/files/descriptor.h"

namespace zal {
namespace {

constexpr std::string_view kSocketFile = "unix:path=";

/// Whether who listens there answers a greeting, too: the first line of the D-Bus standard's
/// "Authentication Protocol", which a daemon answers whatever it thinks of us.
int troubleWithGreeting(const Descriptor& probe) {
  constexpr std::string_view kGreeting{"\0AUTH\r\n", 7};
  if (::send(probe.get(), kGreeting.data(), kGreeting.size(), MSG_NOSIGNAL) < 0) return errno;
  pollfd answer{.fd = probe.get(), .events = POLLIN, .revents = 0};
  const auto end = std::chrono::steady_clock::now() + kAnswerLimit;
  for (;;) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(end - std::chrono::steady_clock::now());
    const int ready = ::poll(&answer, 1, static_cast<int>(std::max<std::int64_t>(left.count(), 0)));
    if (ready > 0) return 0;
    if (ready == 0) return ETIMEDOUT;
    if (errno != EINTR) return errno;
  }
}

/// Zero, or why there is no bus at that socket file; zero too for other kinds of addresses.
int troubleAt(const std::string& address) {
  const std::string_view path =
      std::string_view(address).substr(std::min(kSocketFile.size(), address.size()));
  sockaddr_un socketFile{};
  socketFile.sun_family = AF_UNIX;
  if (!address.starts_with(kSocketFile) || path.find_first_of(",;%") != std::string_view::npos ||
      path.size() >= sizeof socketFile.sun_path) {
    return 0;
  }
  std::copy(path.begin(), path.end(), socketFile.sun_path);
  const Descriptor probe(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  if (!probe.isOpen()) return errno;
  if (::connect(probe.get(), reinterpret_cast<const sockaddr*>(&socketFile), sizeof socketFile) != 0) {
    return errno;
  }
  return troubleWithGreeting(probe);
}

}  // namespace

std::unique_ptr<sdbus::IConnection> openBus(const std::string& address) {
  // The library's 1.2 does not free a connection that it could not open, and waits minutes for a bus that
  // takes connections and says nothing.
  if (const int trouble = troubleAt(address)) throw sdbus::createError(trouble, "Failed to open bus");
  return sdbus::createSessionBusConnectionWithAddress(address);
}

std::unique_ptr<sdbus::IConnection> openPrivateBus(const std::string& address) {
  try {
    auto bus = openBus(address);
    bus->setMethodCallTimeout(kAnswerLimit);
    return bus;
  } catch (const sdbus::Error&) {
    return nullptr;
  }
}

std::optional<std::string> ownerOf(sdbus::IConnection& bus, const std::string& serviceName) {
  try {
    std::string owner;
    sdbus::createProxy(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus")
        ->callMethod("GetNameOwner")
        .onInterface("org.freedesktop.DBus")
        .withTimeout(kAnswerLimit)
        .withArguments(serviceName)
        .storeResultsTo(owner);
    return owner;
  } catch (const sdbus::Error&) {
    return std::nullopt;
  }
}

}  // namespace zal
