#pragma once

#include <sys/types.h>

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace zal::stackshot {

/// What the program was asked for: the machine, or with a process that one alone.
struct Arguments {
  bool help = false;
  std::optional<pid_t> process;
  std::optional<std::string> exception;  ///< what the process survived
  std::optional<std::string> reason;     ///< of a stackshot of the machine
  std::optional<std::string> message;    ///< of a process's report
  std::optional<std::uint32_t> code;
  std::string output;  ///< a directory, a file, or "-"
  std::chrono::milliseconds limit{6000};
};

/// The program's name not among them. A text is what is wrong with them.
[[nodiscard]] std::variant<Arguments, std::string> parseArguments(const std::vector<std::string>& words);

[[nodiscard]] std::string_view helpText();

}  // namespace zal::stackshot
