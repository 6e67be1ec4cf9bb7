#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "bench/archive/random_source.h"

namespace zal::bench {

/// Lines of one log after the other, the time moving on between them.
class LogText {
 public:
  enum class Kind { system, session, request, metric };
  LogText(Kind kind, std::uint64_t seed);
  void appendLine(std::string& text);

 private:
  void _appendMessage(std::string& text);
  void _appendValue(std::string& text, char kind);
  std::uint64_t _identifier();

  const Kind _kind;
  RandomSource _random;
  std::uint64_t _milliseconds;
  std::uint64_t _sequence = 0;
  std::array<std::uint64_t, 24> _identifiers{};
  std::array<std::uint64_t, 12> _readings{};
};

}  // namespace zal::bench
