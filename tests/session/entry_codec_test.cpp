#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <vector>

#include "session/entry_codec.h"

namespace zal {
namespace {

constexpr WallTime kMoment{std::chrono::microseconds{1714651387251499}};

std::string encoded(const SessionEntry& entry) {
  std::string piece = "what was in the buffer";
  encodeEntry(entry, piece);
  return piece;
}

/// Read back and written again it must be the same bytes, which also holds for a time that is no number.
void expectSame(const SessionEntry& entry) {
  const std::string piece = encoded(entry);
  const auto read = decodeEntry(piece);
  ASSERT_TRUE(read);
  EXPECT_EQ(read->kind, entry.kind);
  EXPECT_EQ(read->at, entry.at);
  EXPECT_EQ(read->text, entry.text);
  EXPECT_EQ(read->log, entry.log);
  EXPECT_EQ(read->sender, entry.sender);
  EXPECT_EQ(read->value, entry.value);
  EXPECT_EQ(encoded(*read), piece);
}

const SessionEntry kDescription{.kind = SessionEntryKind::description,
                                .at = kMoment,
                                .text = "Offer",
                                .log = "v=0\nm=audio",
                                .sender = "caller",
                                .time = 1714651382.5};

TEST(EntryCodecTest, EveryKindIsReadAsItWasWritten) {
  for (int kind = 1; kind <= static_cast<int>(kLastSessionEntryKind); ++kind) {
    SessionEntry entry = kDescription;
    entry.kind = static_cast<SessionEntryKind>(kind);
    expectSame(entry);
    expectSame({.kind = entry.kind, .at = kMoment});
  }
}

TEST(EntryCodecTest, NothingAndAnEmptyTextAreTwoThings) {
  for (const OptionalText& text :
       {OptionalText(), OptionalText(""), OptionalText(std::string_view("\0\xFF", 2))}) {
    expectSame({.kind = SessionEntryKind::callInfo, .at = kMoment, .text = text, .log = "x", .sender = text});
  }
}

TEST(EntryCodecTest, ValuesKeepTheirKindAndTimesEveryBit) {
  for (const Number& value : {Number(std::int64_t{-1}), Number(~std::uint64_t{0}), Number(-0.0), Number(true),
                              Number(false), Number(std::numeric_limits<double>::infinity())}) {
    expectSame({.kind = SessionEntryKind::metric, .at = kMoment, .text = "rtt", .value = value});
  }
  for (const double time : {0.1, -1e300, std::nan("")}) {
    expectSame({.kind = SessionEntryKind::checkpoint, .at = kMoment, .time = time});
  }
}

TEST(EntryCodecTest, TheLayoutIsTheOneThatIsWrittenDown) {
  EXPECT_EQ(
      encoded(
          {.kind = SessionEntryKind::begin, .at = WallTime(std::chrono::microseconds{258}), .sender = "me"}),
      std::string("\1\2\4\2\1\0\0\0\0\0\0\2\0\0\0me", 17));
}

TEST(EntryCodecTest, APieceThatIsTooShortTooLongOrUnknownIsNoEntry) {
  const std::string piece = encoded(kDescription);
  for (std::size_t size = 0; size < piece.size(); ++size)
    EXPECT_FALSE(decodeEntry(piece.substr(0, size))) << size;
  EXPECT_FALSE(decodeEntry(piece + "x"));
  for (const auto& [at, byte] : std::vector<std::pair<std::size_t, char>>{
           {0, 0}, {0, 2}, {1, 0}, {1, 17}, {2, 32}, {2, 7}, {10, 0x7F}, {10, '\x80'}}) {
    std::string other = piece;
    other[at] = byte;
    EXPECT_FALSE(decodeEntry(other)) << at;
  }
}

}  // namespace
}  // namespace zal
