#pragma once

#include <functional>
#include <memory>
#include <string>
#include <thread>

#include <asio/executor_work_guard.hpp>
#include <asio/io_context.hpp>

namespace zal::testing {

/// Two network namespaces with names of their own, joined by two cables, and gone at the end:
///
///     near                                      far
///     en0      10.77.0.1/24  fd77::1/64  <-->   far0  10.77.0.2/24  fd77::2/64
///     pdp_ip0  10.78.0.1/24              <-->   far1  10.78.0.2/24
///
/// Near has no default route; far forwards nothing.
class NetworkNamespaces {
 public:
  /// Nothing when this host does not permit namespaces.
  static std::unique_ptr<NetworkNamespaces> make();
  ~NetworkNamespaces();
  NetworkNamespaces(const NetworkNamespaces&) = delete;
  NetworkNamespaces& operator=(const NetworkNamespaces&) = delete;

  /// Runs a shell command in there; false when it failed. What it says goes nowhere.
  bool near(const std::string& command) const { return _in(_near, command); }
  bool far(const std::string& command) const { return _in(_far, command); }
  /// Version 6 uses a cable only some time after it was plugged in; false when it never did.
  [[nodiscard]] bool awaitVersionSix() const {
    return near("n=0; until ping -q -c 1 -w 1 fd77::2; do n=$((n + 1)); [ $n -lt 100 ]; done");
  }
  [[nodiscard]] const std::string& nearName() const { return _near; }
  [[nodiscard]] const std::string& farName() const { return _far; }

 private:
  NetworkNamespaces();
  [[nodiscard]] bool _build() const;
  [[nodiscard]] static bool _in(const std::string& name, const std::string& command);
  const std::string _near, _far;
};

/// A thread whose sockets live in the namespace. Throws when there is no such namespace.
[[nodiscard]] std::thread threadIn(const std::string& name, std::function<void()> work);

/// A loop on a thread that lives in a namespace. The thread ends with the object; the context goes
/// after it, and with it what still ran.
class NamespaceLoop {
 public:
  explicit NamespaceLoop(const std::string& name);
  ~NamespaceLoop();
  NamespaceLoop(const NamespaceLoop&) = delete;
  NamespaceLoop& operator=(const NamespaceLoop&) = delete;

  asio::io_context context{1};

 private:
  asio::executor_work_guard<asio::io_context::executor_type> _work{context.get_executor()};
  std::thread _thread;
};

}  // namespace zal::testing
