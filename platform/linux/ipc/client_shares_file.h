#pragma once

#include <string>

#include "platform/clock.h"
#include "platform/linux/ipc/client_shares.h"

namespace zal {

/// Shows other processes what clients have of the agent's memory, for as long as that is worth a word. Main
/// thread only.
class ClientSharesFile {
 public:
  /// No path: nobody is shown anything.
  explicit ClientSharesFile(std::string path) : _path(std::move(path)) {}
  ~ClientSharesFile() { remove(); }
  ClientSharesFile(const ClientSharesFile&) = delete;
  ClientSharesFile& operator=(const ClientSharesFile&) = delete;

  /// Whether the last one is old enough: in a flood of questions it is not written for each.
  [[nodiscard]] bool isDue(SteadyTime now) const;
  void write(const ClientShares& shares, SteadyTime now);
  void remove();

 private:
  const std::string _path;
  SteadyTime _written{};
  bool _isThere = false;
};

}  // namespace zal
