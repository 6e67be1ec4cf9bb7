#pragma once

#include <map>
#include <string>

#include "platform/clock.h"

namespace zal::secretlist {

/// What the secret service tells about an item without the secret itself.
struct SecretItem {
  std::string label;
  std::map<std::string, std::string> attributes;
  WallTime created{};
  bool isLocked = false;
};

/// Whether it belongs to an account at a server: it names a server, host, domain or protocol.
[[nodiscard]] bool isInternetItem(const SecretItem& item);

/// The item as people read it, several lines with their ends. Of the attributes only those that say
/// where and for whom an item is are shown with their values; programs put what they like into the
/// others, secrets included. Control characters are escaped.
[[nodiscard]] std::string itemText(const SecretItem& item, const Clock& clock);

}  // namespace zal::secretlist
