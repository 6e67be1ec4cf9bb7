#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace zal::tessel {

/// What tessel was asked for.
struct Arguments {
  bool help = false;
  bool follow = false;                           ///< -w: only what comes from now on, without end
  std::optional<std::chrono::seconds> lookBack;  ///< -k Time ge -5m: no older than that
  // Where to look instead of the host's usual places. With one of them given, the others are left out.
  std::optional<std::string> journalDirectory;
  std::optional<std::string> syslogFile;
  std::optional<std::string> kernelLog;

  [[nodiscard]] bool namesASource() const { return journalDirectory || syslogFile || kernelLog; }
};

/// The program's name not among them. A text is what is wrong with them.
[[nodiscard]] std::variant<Arguments, std::string> parseArguments(const std::vector<std::string>& words);

/// "-5m" as five minutes; s, m, h and d are the units. Nothing for any other text.
[[nodiscard]] std::optional<std::chrono::seconds> parseAge(std::string_view text);

[[nodiscard]] std::string_view helpText();

}  // namespace zal::tessel
