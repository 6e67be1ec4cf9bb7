#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

namespace zal {

struct Value;
using ValueMap = std::map<std::string, Value, std::less<>>;
using ValueList = std::vector<Value>;

/// A plain value object as requests and replies carry them. Owns everything below it.
struct Value {
  using Storage = std::variant<std::nullptr_t, bool, std::int64_t, std::uint64_t, double, std::string,
                               ValueList, ValueMap>;
  Storage storage;

  Value() : storage(nullptr) {}
  /// From anything that the storage takes, so that dictionaries read as they are written.
  template <class T>
  requires(!std::is_same_v<std::remove_cvref_t<T>, Value> && std::is_constructible_v<Storage, T>)
      // NOLINTNEXTLINE(bugprone-forwarding-reference-overload)
      Value(T&& value)
      : storage(std::forward<T>(value)) {}

  template <class T>
  [[nodiscard]] const T* as() const {
    return std::get_if<T>(&storage);
  }
  bool operator==(const Value&) const = default;
};

/// A number whose own kind is kept, so that it prints as the client sent it.
using Number = std::variant<std::int64_t, std::uint64_t, double, bool>;

/// Shortest text that reads back as the same number: "5" for 5.0, "4.5", "-3", "1" for true.
[[nodiscard]] std::string numberText(const Number& number);
[[nodiscard]] double numberAsDouble(const Number& number);

}  // namespace zal
