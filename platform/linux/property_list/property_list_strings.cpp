#include "platform/linux/property_list/property_list_strings.h"

#include <pugixml.hpp>

namespace zal {

std::optional<std::map<std::string, std::string>> propertyListStrings(std::string_view text) {
  pugi::xml_document document;
  constexpr unsigned kKeepBlanks = pugi::parse_default | pugi::parse_ws_pcdata_single;
  if (!document.load_buffer(text.data(), text.size(), kKeepBlanks)) return std::nullopt;
  const pugi::xml_node dictionary = document.child("plist").child("dict");
  if (!dictionary) return std::nullopt;
  std::map<std::string, std::string> strings;
  std::optional<std::string> key;
  for (const pugi::xml_node node : dictionary.children()) {
    if (node.type() != pugi::node_element) continue;
    if (std::string_view(node.name()) == "key") {
      if (key) return std::nullopt;  // a key without a value
      key = node.text().get();
      continue;
    }
    if (!key) return std::nullopt;  // a value without a key
    if (std::string_view(node.name()) == "string") strings.emplace(*key, node.text().get());
    key.reset();
  }
  if (key) return std::nullopt;
  return strings;
}

}  // namespace zal
