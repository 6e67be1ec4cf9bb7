#include "session/entry_codec.h"

#include <bit>
#include <cstddef>
#include <limits>
#include <type_traits>

namespace zal {
namespace {

constexpr std::uint8_t kVersion = 1;
constexpr double kInfinity = std::numeric_limits<double>::infinity();

enum Present : std::uint8_t { kText = 1, kLog = 2, kSender = 4, kTime = 8, kValue = 16, kAll = 31 };
enum ValueKind : std::uint8_t { kSigned, kUnsigned, kDouble, kBoolean };

template <class Unsigned>
void put(std::string& bytes, Unsigned value) {
  char text[sizeof value];
  for (std::size_t i = 0; i < sizeof value; ++i) text[i] = static_cast<char>(std::uint64_t{value} >> (8 * i));
  bytes.append(text, sizeof text);
}

void putText(std::string& bytes, OptionalText text) {
  if (!text) return;
  put(bytes, static_cast<std::uint32_t>(text->size()));
  bytes.append(*text);
}

void putValue(std::string& bytes, const Number& number) {
  put(bytes, static_cast<std::uint8_t>(number.index()));
  put(bytes, std::visit(
                 [](auto value) -> std::uint64_t {
                   if constexpr (std::is_same_v<decltype(value), double>) {
                     return std::bit_cast<std::uint64_t>(value);
                   } else {
                     return static_cast<std::uint64_t>(value);
                   }
                 },
                 number));
}

/// Takes a piece apart from its front; what is asked for beyond its end makes it fail for good.
class Reader {
 public:
  explicit Reader(std::string_view bytes) : _rest(bytes) {}

  template <class Unsigned>
  Unsigned number() {
    std::uint64_t value = 0;
    const std::string_view bytes = take(sizeof(Unsigned));
    for (std::size_t i = 0; i < bytes.size(); ++i) {
      value |= std::uint64_t{static_cast<unsigned char>(bytes[i])} << (8 * i);
    }
    return static_cast<Unsigned>(value);
  }
  std::string_view take(std::size_t size) {
    if (size > _rest.size()) _failed = true;
    if (_failed) return {};
    const std::string_view taken = _rest.substr(0, size);
    _rest.remove_prefix(size);
    return taken;
  }
  OptionalText text() { return take(number<std::uint32_t>()); }
  double real() { return std::bit_cast<double>(number<std::uint64_t>()); }
  Number value() {
    const auto kind = number<std::uint8_t>();
    const auto bits = number<std::uint64_t>();
    if (kind == kSigned) return static_cast<std::int64_t>(bits);
    if (kind == kUnsigned) return bits;
    if (kind == kDouble) return std::bit_cast<double>(bits);
    if (kind != kBoolean || bits > 1) _failed = true;
    return bits == 1;
  }
  [[nodiscard]] bool isReadWhole() const { return !_failed && _rest.empty(); }

 private:
  std::string_view _rest;
  bool _failed = false;
};

bool hasTime(SessionEntryKind kind) {
  return kind == SessionEntryKind::checkpoint || kind == SessionEntryKind::description;
}

}  // namespace

static_assert(std::is_same_v<Number, std::variant<std::int64_t, std::uint64_t, double, bool>>,
              "a value is written by its place in the variant");

void encodeEntry(const SessionEntry& entry, std::string& buffer) {
  unsigned present = 0;
  if (entry.text) present |= kText;
  if (entry.log) present |= kLog;
  if (entry.sender) present |= kSender;
  if (hasTime(entry.kind)) present |= kTime;
  if (entry.value) present |= kValue;
  buffer.clear();
  put(buffer, kVersion);
  put(buffer, static_cast<std::uint8_t>(entry.kind));
  put(buffer, static_cast<std::uint8_t>(present));
  put(buffer, static_cast<std::uint64_t>(entry.at.time_since_epoch().count()));
  if (hasTime(entry.kind)) put(buffer, std::bit_cast<std::uint64_t>(entry.time));
  if (entry.value) putValue(buffer, *entry.value);
  for (const OptionalText& text : {entry.text, entry.log, entry.sender}) putText(buffer, text);
}

std::optional<SessionEntry> decodeEntry(std::string_view piece) {
  Reader reader(piece);
  if (reader.number<std::uint8_t>() != kVersion) return std::nullopt;
  SessionEntry entry;
  const auto kind = reader.number<std::uint8_t>();
  if (kind == 0 || kind > static_cast<std::uint8_t>(kLastSessionEntryKind)) return std::nullopt;
  entry.kind = static_cast<SessionEntryKind>(kind);
  const auto present = reader.number<std::uint8_t>();
  if (present > kAll || ((present & kTime) != 0) != hasTime(entry.kind)) return std::nullopt;
  entry.at = WallTime(WallTime::duration(static_cast<std::int64_t>(reader.number<std::uint64_t>())));
  // What the calendar cannot show is no moment at which anything was taken.
  if (entry.at < wallTimeFromSeconds(-kInfinity) || entry.at > wallTimeFromSeconds(kInfinity)) {
    return std::nullopt;
  }
  if ((present & kTime) != 0) entry.time = reader.real();
  if ((present & kValue) != 0) entry.value = reader.value();
  if ((present & kText) != 0) entry.text = reader.text();
  if ((present & kLog) != 0) entry.log = reader.text();
  if ((present & kSender) != 0) entry.sender = reader.text();
  if (!reader.isReadWhole()) return std::nullopt;
  return entry;
}

}  // namespace zal
