#include <string>
#include <vector>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/property_list/property_list_strings.h"
#include "platform/linux/property_list/property_list_text.h"

namespace zal {
namespace {

using Strings = std::map<std::string, std::string>;

std::optional<Strings> writtenAndRead(const Strings& strings) {
  ValueMap dictionary;
  for (const auto& [key, text] : strings) dictionary[key] = text;
  return propertyListStrings(propertyListText(dictionary));
}

}  // namespace

void fuzzPropertyList(const std::uint8_t* data, std::size_t size) {
  const std::vector<char> alone(data, data + size);  // its ends are watched
  const auto strings = propertyListStrings({alone.data(), alone.size()});
  if (!strings) return;
  // Texts that XML cannot hold change once, and never again.
  const auto once = writtenAndRead(*strings);
  promise(once.has_value(), "what was read can be written as a list that can be read");
  promise(once->size() <= strings->size(), "no key comes out of nothing");
  promise(writtenAndRead(*once) == once, "what was written is read as it was");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzPropertyList(data, size);
  return 0;
}
#endif
