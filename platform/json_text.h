#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// The text as a JSON string. Bytes that are no UTF-8 become U+FFFD; what could disturb a terminal is
/// escaped.
[[nodiscard]] std::string jsonString(std::string_view text);
/// From elements that are JSON already.
[[nodiscard]] std::string jsonArray(const std::vector<std::string>& elements);

/// A JSON object, its keys in the order they were added.
class JsonObject {
 public:
  JsonObject& add(std::string_view key, std::string_view text) { return addJson(key, jsonString(text)); }
  JsonObject& add(std::string_view key, const char* text) { return add(key, std::string_view(text)); }
  JsonObject& add(std::string_view key, bool value) { return addJson(key, value ? "true" : "false"); }
  JsonObject& add(std::string_view key, std::int64_t value) { return addJson(key, std::to_string(value)); }
  JsonObject& add(std::string_view key, std::uint64_t value) { return addJson(key, std::to_string(value)); }
  JsonObject& addJson(std::string_view key, std::string_view json);
  [[nodiscard]] std::string text() const { return "{" + _members + "}"; }

 private:
  std::string _members;
};

}  // namespace zal
