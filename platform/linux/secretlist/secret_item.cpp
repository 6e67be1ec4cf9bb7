#include "platform/linux/secretlist/secret_item.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>

#include "platform/linux/files/escaped_text.h"

namespace zal::secretlist {
namespace {

constexpr std::array<std::string_view, 4> kOfServers = {"server", "host", "domain", "protocol"};

bool isOfServer(std::string_view attribute) {
  return std::find(kOfServers.begin(), kOfServers.end(), attribute) != kOfServers.end();
}

bool showsValue(std::string_view attribute) { return isOfServer(attribute) || attribute == "user"; }

std::string timeText(WallTime time, const Clock& clock) {
  const LocalTime local = clock.localTime(time);
  char text[64];
  std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d", local.year, local.month, local.day,
                local.hour, local.minute, local.second);
  return text;
}

}  // namespace

bool isInternetItem(const SecretItem& item) {
  return std::any_of(item.attributes.begin(), item.attributes.end(),
                     [](const auto& attribute) { return isOfServer(attribute.first); });
}

std::string itemText(const SecretItem& item, const Clock& clock) {
  std::string text = "label: " + escapedLine(item.label) + "\n    created: " + timeText(item.created, clock) +
                     "\n    locked: " + (item.isLocked ? "yes" : "no") + "\n";
  std::string others;
  for (const auto& [name, value] : item.attributes) {
    if (showsValue(name)) {
      text += "    " + name + ": " + escapedLine(value) + "\n";
    } else {
      others += (others.empty() ? "" : ", ") + escapedLine(name);
    }
  }
  return others.empty() ? text : text + "    other attributes: " + others + "\n";
}

}  // namespace zal::secretlist
