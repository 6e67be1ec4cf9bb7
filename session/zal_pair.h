#pragma once

namespace zal {

/// Two values that travel together.
template <class First, class Second>
struct ZalPair {
  First first{};
  Second second{};
  bool operator==(const ZalPair&) const = default;
};

}  // namespace zal
