#include "dump/user_info.h"

namespace zal {
namespace {

const Value* find(const ValueMap* userInfo, std::string_view key) {
  if (userInfo == nullptr) return nullptr;
  const auto found = userInfo->find(key);
  return found != userInfo->end() ? &found->second : nullptr;
}

}  // namespace

std::optional<std::string> textOf(const ValueMap* userInfo, std::string_view key) {
  const Value* const value = find(userInfo, key);
  const auto* const text = value != nullptr ? value->as<std::string>() : nullptr;
  return text != nullptr ? std::optional<std::string>(*text) : std::nullopt;
}

std::int32_t integerOf(const ValueMap* userInfo, std::string_view key) {
  const Value* const value = find(userInfo, key);
  if (value == nullptr) return 0;
  if (const auto* const integer = value->as<std::int64_t>()) return static_cast<std::int32_t>(*integer);
  if (const auto* const natural = value->as<std::uint64_t>()) return static_cast<std::int32_t>(*natural);
  if (const auto* const truth = value->as<bool>()) return *truth ? 1 : 0;
  if (const auto* const real = value->as<double>()) {
    constexpr double kLimit = 2147483647.0;
    if (*real >= -kLimit && *real <= kLimit) return static_cast<std::int32_t>(*real);
  }
  return 0;
}

std::optional<bool> booleanOf(const ValueMap* userInfo, std::string_view key) {
  const Value* const value = find(userInfo, key);
  if (value == nullptr) return std::nullopt;
  if (const auto* const truth = value->as<bool>()) return *truth;
  if (const auto* const integer = value->as<std::int64_t>()) return *integer != 0;
  if (const auto* const natural = value->as<std::uint64_t>()) return *natural != 0;
  if (const auto* const real = value->as<double>()) return *real != 0;
  // Present, but nothing that has a truth.
  return false;
}

}  // namespace zal
