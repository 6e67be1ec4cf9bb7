#pragma once

#include <cstdint>
#include <string>

namespace zal::bench {

/// The log set that the records go to, where a server has such a thing.
inline constexpr const char* kRecordType = "Bench";
inline constexpr std::size_t kRecordLength = 120;
inline constexpr std::size_t kNumberDigits = 8;

/// A record's text as clients write them: 120 bytes, of which eight digits change from one to the next
/// so that no server can store two of them as one.
class RecordText {
 public:
  explicit RecordText(unsigned client)
      : _text("client " + std::to_string(client % 10) + " record 00000000 ") {
    static constexpr const char* kWords =
        "transport changed its route from wifi to cellular, estimated rate 1480 kbit/s, jitter 11.4 ms, loss "
        "0.2 %";
    while (_text.size() < kRecordLength) _text += kWords;
    _text.resize(kRecordLength);
  }
  [[nodiscard]] const std::string& text() const { return _text; }

 private:
  std::string _text;
};

inline constexpr const char* kNumberMark = "record 00000000";

/// Where the number stands inside anything that holds a record's text as it is.
[[nodiscard]] inline std::size_t numberPosition(const std::string& holder) {
  return holder.find(kNumberMark) + std::string(kNumberMark).size() - kNumberDigits;
}

inline void putNumber(std::string& holder, std::size_t position, std::uint64_t number) {
  for (std::size_t digit = kNumberDigits; digit-- > 0; number /= 10) {
    holder[position + digit] = static_cast<char>('0' + number % 10);
  }
}

}  // namespace zal::bench
