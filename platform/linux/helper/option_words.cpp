#include "platform/linux/helper/option_words.h"

#include <charconv>
#include <system_error>

namespace zal::helper {
namespace {

bool takeSeconds(const std::string& word, std::chrono::seconds& place) {
  int number = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), number);
  if (error != std::errc{} || end != word.data() + word.size() || number < 0) return false;
  place = std::chrono::seconds{number};
  return true;
}

}  // namespace

bool takeOptions(const std::vector<std::string>& words, const OptionPlaces& places) {
  for (std::size_t i = 0; i + 1 < words.size(); i += 2) {
    if (const auto text = places.texts.find(words[i]); text != places.texts.end()) {
      *text->second = words[i + 1];
    } else if (const auto time = places.times.find(words[i]); time != places.times.end()) {
      if (!takeSeconds(words[i + 1], *time->second)) return false;
    } else {
      return false;
    }
  }
  return words.size() % 2 == 0;
}

}  // namespace zal::helper
