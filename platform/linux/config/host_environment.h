#pragma once

#include <sys/types.h>

#include <map>
#include <string>
#include <string_view>

namespace zal {

/// What the process was started with, as a value: all that decides where files lie, so that a test
/// can be any user on any host.
struct HostEnvironment {
  std::map<std::string, std::string, std::less<>> variables;
  uid_t userId = 0;  ///< effective; 0 makes a system agent
  std::string homeDirectory;
  std::string executableDirectory = {};  ///< of the running program; empty: nobody knows

  /// Reads environment, user and home directory (`HOME`, else the user database, else "/"), and where
  /// the program lies.
  [[nodiscard]] static HostEnvironment ofThisProcess();

  [[nodiscard]] bool isSystem() const { return userId == 0; }
  /// The variable's value; empty when it is not set.
  [[nodiscard]] std::string variable(std::string_view name) const;
  /// The variable's value when it is an absolute path, without trailing slashes; else empty.
  [[nodiscard]] std::string directoryVariable(std::string_view name) const;
};

}  // namespace zal
