#include "platform/linux/bus/private_bus.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <cerrno>
#include <string_view>

#include "platform/linux/files/descriptor.h"

namespace zal {
namespace {

constexpr std::string_view kSocketFile = "unix:path=";

/// Zero, or why nobody takes connections at that socket file; zero too for other kinds of addresses.
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
  const bool isTaken =
      ::connect(probe.get(), reinterpret_cast<const sockaddr*>(&socketFile), sizeof socketFile) == 0;
  return isTaken || errno == EAGAIN ? 0 : errno;
}

}  // namespace

std::unique_ptr<sdbus::IConnection> openBus(const std::string& address) {
  // The library's 1.2 does not free a connection that it could not open.
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
