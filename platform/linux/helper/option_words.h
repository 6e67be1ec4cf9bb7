#pragma once

#include <chrono>
#include <map>
#include <string>
#include <vector>

namespace zal::helper {

/// Where the values of a program's options go. Each option is a word of its own before its value.
struct OptionPlaces {
  std::map<std::string, std::string*> texts;
  std::map<std::string, std::chrono::seconds*> times;  ///< whole seconds, none negative
};

/// Puts the values of all words into their places. False for words that are none of these options.
[[nodiscard]] bool takeOptions(const std::vector<std::string>& words, const OptionPlaces& places);

}  // namespace zal::helper
