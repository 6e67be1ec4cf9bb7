#include <algorithm>
#include <string>
#include <vector>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/wire/flex_verifier.h"
#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/utf8.h"
#include "platform/linux/wire/wire_message.h"

namespace zal {
namespace {

constexpr std::size_t kMostKeys = 64;

/// The keys that requests have, and those that this one has.
std::vector<std::string> keysToAsk(std::string_view payload) {
  std::vector<std::string> keys{
      "__ipc__event_code__", "sessionType", "sender", "time", "number", "userInfo", ""};
  const auto root = verifiedFlexRoot(payload);
  const auto map = root->asMap();
  for (std::size_t i = 0; i < std::min(map->size(), kMostKeys); ++i) keys.emplace_back(map->key(i));
  return keys;
}

void readDictionary(const ValueMap& dictionary) {
  const std::string bytes = encodeDictionary(dictionary);
  const auto again = verifiedFlexRoot(bytes);
  promise(again && again->asMap(), "a dictionary that was read can be written");
}

void readKey(const WireMessage& message, const std::string& key) {
  if (const auto text = message.string(key)) promise(isUtf8(*text), "text is valid UTF-8");
  int numbers = 0;
  numbers += message.int64(key) != 0 ? 1 : 0;
  numbers += message.uint64(key) != 0 ? 1 : 0;
  numbers += message.real(key) != 0.0 ? 1 : 0;
  numbers += message.string(key) ? 1 : 0;
  if (const auto number = message.codedNumber(key)) {
    ++numbers;
    promise(!numberText(*number).empty(), "a number has a text");
  }
  if (const auto dictionary = message.dictionary(key)) {
    ++numbers;
    readDictionary(*dictionary);
  }
  promise(numbers <= 1, "a value reads as one type only");
}

}  // namespace

void fuzzMessage(const std::uint8_t* data, std::size_t size) {
  const std::vector<char> alone(data, data + size);  // its ends are watched
  const std::string_view payload(alone.data(), alone.size());
  FrameHeader header;
  header.length = static_cast<std::uint32_t>(size);
  const auto message = WireMessage::fromFrame({header, payload});
  if (!message) return;
  for (const std::string& key : keysToAsk(payload)) readKey(*message, key);
  const std::string description = message->description();
  promise(isUtf8(description), "a description is valid UTF-8");
  promise(description.size() < 16384, "a description is bounded");
  promise(std::none_of(description.begin(), description.end(),
                       [](char character) { return static_cast<unsigned char>(character) < 0x20; }),
          "a description is one printable line");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzMessage(data, size);
  return 0;
}
#endif
