#pragma once

#include <cstddef>
#include <deque>
#include <string>
#include <string_view>

namespace zal {

/// The roads that a notification may come by.
enum class PostRoad { directory, bus };

/// Tells the second copy of a post from a new one: what has the id of a post that came by the other
/// road. Posts without an id have no copies. Remembers the latest posts that came by one road alone.
class PostCopies {
 public:
  static constexpr std::size_t kMostRemembered = 256;

  /// To be asked once for each arrival.
  [[nodiscard]] bool isCopy(std::string_view id, PostRoad road);

 private:
  struct Arrival {
    std::string id;
    PostRoad road;
  };
  std::deque<Arrival> _single;
};

/// An id that no other post has, for this post alone: 32 hexadecimal digits that nobody can foresee.
[[nodiscard]] std::string newPostId();

}  // namespace zal
