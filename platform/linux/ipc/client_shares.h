#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace zal {

/// What a connected client has of the agent's memory.
struct ClientShare {
  pid_t process = 0;
  uid_t user = 0;
  std::uint64_t bytes = 0;            ///< of lines it sent that are in memory
  std::uint64_t delayedMessages = 0;  ///< that had to wait in its socket until there was room for them
  bool isWaiting = false;             ///< at this moment nothing is read from it
  bool operator==(const ClientShare&) const = default;
};

/// What all of them have.
struct ClientShares {
  pid_t agent = 0;
  std::uint64_t bytes = 0;  ///< of all lines in memory, those of former clients included
  std::vector<ClientShare> clients;
  bool operator==(const ClientShares&) const = default;
};

// As a file, for other processes to read: one line for the agent, one for each client.
//
//     agent PROCESS BYTES
//     client PROCESS USER BYTES DELAYED reads|waits

/// Where a runtime directory keeps it.
[[nodiscard]] std::string clientSharesPath(const std::string& runtimeRoot);
[[nodiscard]] std::string clientSharesText(const ClientShares& shares);
/// Nothing where there is no such file.
[[nodiscard]] std::optional<ClientShares> readClientShares(const std::string& path);

}  // namespace zal
