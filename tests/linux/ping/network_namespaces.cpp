#include "tests/linux/ping/network_namespaces.h"

#include <fcntl.h>
#include <sched.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <random>
#include <stdexcept>
#include <utility>

namespace zal::testing {
namespace {

bool run(const std::string& command) { return std::system((command + " >/dev/null 2>&1").c_str()) == 0; }

std::string randomName() {
  std::random_device random;
  char text[32];
  std::snprintf(text, sizeof text, "zal-%08x", static_cast<unsigned>(random()));
  return text;
}

}  // namespace

NetworkNamespaces::NetworkNamespaces() : _near(randomName() + "-near"), _far(_near + "-far") {}

std::unique_ptr<NetworkNamespaces> NetworkNamespaces::make() {
  std::unique_ptr<NetworkNamespaces> made(new NetworkNamespaces);
  if (!made->_build()) made.reset();
  return made;
}

NetworkNamespaces::~NetworkNamespaces() {
  run("ip netns del " + _near);
  run("ip netns del " + _far);
}

bool NetworkNamespaces::_in(const std::string& name, const std::string& command) {
  return run("ip netns exec " + name + " /bin/sh -ec '" + command + "'");
}

bool NetworkNamespaces::_build() const {
  const auto cable = [this](const std::string& nearEnd, const std::string& farEnd) {
    return run("ip -n " + _near + " link add " + nearEnd + " type veth peer name " + farEnd + " netns " +
               _far);
  };
  // Addresses are usable at once, and a neighbour that is not there is given up soon.
  const std::string quick =
      "for f in /proc/sys/net/ipv6/conf/*/accept_dad; do echo 0 > $f; done; "
      "for f in /proc/sys/net/ipv?/neigh/*/retrans_time_ms; do echo 50 > $f; done; ip link set lo up; ";
  return run("ip netns add " + _near) && run("ip netns add " + _far) && cable("en0", "far0") &&
         cable("pdp_ip0", "far1") &&
         near(quick +
              "ip addr add 10.77.0.1/24 dev en0; ip addr add fd77::1/64 dev en0 nodad; "
              "ip addr add 10.78.0.1/24 dev pdp_ip0; ip link set en0 up; ip link set pdp_ip0 up") &&
         far(quick +
             "ip addr add 10.77.0.2/24 dev far0; ip addr add fd77::2/64 dev far0 nodad; "
             "ip addr add 10.78.0.2/24 dev far1; ip link set far0 up; ip link set far1 up");
}

std::thread threadIn(const std::string& name, std::function<void()> work) {
  const int space = ::open(("/run/netns/" + name).c_str(), O_RDONLY | O_CLOEXEC);
  if (space < 0) throw std::runtime_error("no such network namespace: " + name);
  return std::thread([space, work = std::move(work)] {
    const bool entered = ::setns(space, CLONE_NEWNET) == 0;
    ::close(space);
    if (!entered) std::abort();  // the packets of a test must not leave it
    work();
  });
}

NamespaceLoop::NamespaceLoop(const std::string& name) : _thread(threadIn(name, [this] { context.run(); })) {}

NamespaceLoop::~NamespaceLoop() {
  context.stop();
  _thread.join();
}

}  // namespace zal::testing
