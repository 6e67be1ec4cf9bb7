#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

namespace zal::bench {

/// The same numbers on every machine.
class RandomSource {
 public:
  explicit RandomSource(std::uint64_t seed) : _state(seed) {}

  std::uint64_t next() {
    _state += 0x9E3779B97F4A7C15U;
    std::uint64_t mixed = _state;
    mixed = (mixed ^ (mixed >> 30U)) * 0xBF58476D1CE4E5B9U;
    mixed = (mixed ^ (mixed >> 27U)) * 0x94D049BB133111EBU;
    return mixed ^ (mixed >> 31U);
  }
  std::uint64_t below(std::uint64_t limit) { return next() % limit; }
  /// Mostly near zero, seldom near the limit.
  std::uint64_t rather(std::uint64_t limit) { return below(below(limit) + 1); }
  template <typename Value, std::size_t Count>
  const Value& of(const Value (&values)[Count]) {
    return values[below(Count)];
  }
  void append(std::string& bytes, std::size_t count) {
    while (count > 0) {
      const std::uint64_t eight = next();
      const std::size_t part = count < sizeof eight ? count : sizeof eight;
      bytes.append(reinterpret_cast<const char*>(&eight), part);
      count -= part;
    }
  }

 private:
  std::uint64_t _state;
};

}  // namespace zal::bench
