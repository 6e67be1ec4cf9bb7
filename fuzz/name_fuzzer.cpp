#include <stdexcept>
#include <string>
#include <vector>

#include "collectors/name_timestamp.h"
#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/loop/linux_clock.h"

namespace zal {

void fuzzName(const std::uint8_t* data, std::size_t size) {
  static const LinuxClock clock;
  const std::vector<char> alone(data, data + size);  // its ends are watched
  const std::string_view name(alone.data(), alone.size());
  for (const std::string_view form : {kDashedTimestamp, kCompactTimestamp}) {
    for (std::size_t position = 0; position <= name.size() + 1; ++position) {
      const bool hasRoom = position + form.size() <= name.size();
      try {
        const auto moment = timestampAt(name, position, form, clock);
        promise(hasRoom, "a name that ends too early is said to");
        if (!moment) continue;
        const std::string text = timestampText(*moment, form, clock);
        // An hour that the clocks skip reads as one beside it; what is read once stays.
        promise(parseTimestamp(text, form, clock) == moment, "a moment's text names the moment");
      } catch (const std::out_of_range&) {
        promise(!hasRoom, "a name with room for a timestamp is read");
      }
    }
  }
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzName(data, size);
  return 0;
}
#endif
