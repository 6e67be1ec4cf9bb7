#include "platform/linux/notifications/post_copies.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <random>

namespace zal {

bool PostCopies::isCopy(std::string_view id, PostRoad road) {
  if (id.empty()) return false;
  const auto other = std::find_if(_single.begin(), _single.end(), [&](const Arrival& arrival) {
    return arrival.id == id && arrival.road != road;
  });
  if (other != _single.end()) {
    _single.erase(other);
    return true;
  }
  if (_single.size() == kMostRemembered) _single.pop_front();
  _single.push_back({std::string(id), road});
  return false;
}

std::string newPostId() {
  std::random_device bits;
  std::array<char, 33> text{};
  std::snprintf(text.data(), text.size(), "%08x%08x%08x%08x", bits(), bits(), bits(), bits());
  return text.data();
}

}  // namespace zal
