#include "platform/linux/property_list/property_list_text.h"

#include <cmath>
#include <sstream>
#include <type_traits>

#include <pugixml.hpp>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

bool isXmlCharacter(char32_t codePoint) {
  if (codePoint < 0x20) return codePoint == '\t' || codePoint == '\n' || codePoint == '\r';
  return codePoint != 0xFFFE && codePoint != 0xFFFF;
}

/// In the words of property lists, which all of their readers take.
std::string realText(double real) {
  if (std::isnan(real)) return "nan";
  if (std::isinf(real)) return real > 0 ? "+infinity" : "-infinity";
  return numberText(real);
}

void appendText(pugi::xml_node parent, const char* element, const std::string& text) {
  parent.append_child(element).append_child(pugi::node_pcdata).set_value(text.c_str());
}

void appendValue(pugi::xml_node parent, const Value& value);

void appendDictionary(pugi::xml_node parent, const ValueMap& dictionary) {
  pugi::xml_node node = parent.append_child("dict");
  for (const auto& [key, value] : dictionary) {
    if (value.as<std::nullptr_t>() != nullptr) continue;
    appendText(node, "key", textForXml(key));
    appendValue(node, value);
  }
}

void appendList(pugi::xml_node parent, const ValueList& list) {
  pugi::xml_node node = parent.append_child("array");
  for (const Value& value : list) appendValue(node, value);
}

void appendValue(pugi::xml_node parent, const Value& value) {
  std::visit(
      [&]<class T>(const T& content) {
        if constexpr (std::is_same_v<T, bool>) {
          parent.append_child(content ? "true" : "false");
        } else if constexpr (std::is_integral_v<T>) {
          appendText(parent, "integer", std::to_string(content));
        } else if constexpr (std::is_same_v<T, double>) {
          appendText(parent, "real", realText(content));
        } else if constexpr (std::is_same_v<T, std::string>) {
          appendText(parent, "string", textForXml(content));
        } else if constexpr (std::is_same_v<T, ValueList>) {
          appendList(parent, content);
        } else if constexpr (std::is_same_v<T, ValueMap>) {
          appendDictionary(parent, content);
        }
      },
      value.storage);
}

}  // namespace

std::string textForXml(std::string_view text) {
  std::string out;
  const std::string valid = replacedUtf8(text);
  for (std::string_view rest = valid; !rest.empty();) {
    const Utf8Step step = nextUtf8(rest);
    if (isXmlCharacter(step.codePoint)) out.append(rest.substr(0, step.size));
    rest.remove_prefix(step.size);
  }
  return out;
}

std::string propertyListText(const ValueMap& dictionary) {
  pugi::xml_document document;
  pugi::xml_node declaration = document.append_child(pugi::node_declaration);
  declaration.append_attribute("version") = "1.0";
  declaration.append_attribute("encoding") = "UTF-8";
  pugi::xml_node list = document.append_child("plist");
  list.append_attribute("version") = "1.0";
  appendDictionary(list, dictionary);
  std::ostringstream text;
  document.save(text, "  ", pugi::format_indent, pugi::encoding_utf8);
  return text.str();
}

}  // namespace zal
