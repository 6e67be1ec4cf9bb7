#include "platform/linux/log/record_text.h"

#include <gtest/gtest.h>

#include "platform/linux/log/record_time.h"
#include "tests/support/manual_run_loop.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

std::string marked(std::string_view text, std::string_view prefix = {}) {
  std::string target;
  appendMarkedText(target, text, prefix);
  return target;
}

std::string formatted(const LogRecord& record) {
  std::string target;
  appendRecord(target, record, "2024-05-02 14:03:07.251", "zalloggingagent[42]");
  return target;
}

TEST(RecordTextTest, ARecordIsOneLine) {
  EXPECT_EQ(formatted({6, "Vistel", "Vistel", false, "[caller:Media] started", 0}),
            "2024-05-02 14:03:07.251 <6> [caller:Media] started\n");
}

TEST(RecordTextTest, TheClientsTimeStandsThereWhenThereIsOne) {
  EXPECT_EQ(formatted({3, "T", "T", false, "x", UINT64_MAX}),
            "2024-05-02 14:03:07.251 <3> t=18446744073709551615 x\n");
  for (const std::uint64_t time :
       {1ULL, 9ULL, 10ULL, 99ULL, 100ULL, 101ULL, 999ULL, 1000ULL, 1700000000123ULL}) {
    EXPECT_EQ(formatted({0, "T", "T", false, "x", time}),
              "2024-05-02 14:03:07.251 <0> t=" + std::to_string(time) + " x\n");
  }
}

TEST(RecordTextTest, ProcessInformationStandsBeforeTheLine) {
  EXPECT_EQ(formatted({-1, "T", "T", true, "x", 7}),
            "2024-05-02 14:03:07.251 <-1> t=7 zalloggingagent[42] x\n");
}

TEST(RecordTextTest, AClientCannotForgeARecord) {
  EXPECT_EQ(formatted({6, "T", "T", false, "one\n2024-05-02 14:03:07.251 <6> forged\n", 0}),
            "2024-05-02 14:03:07.251 <6> one\n"
            "    | 2024-05-02 14:03:07.251 <6> forged\n"
            "    | \n");
}

TEST(RecordTextTest, ControlCharactersAreEscapedButTabsStay) {
  EXPECT_EQ(marked(std::string("a\0b\tc\rd\x1b[31m\x7f", 13)), "a\\x00b\tc\\x0dd\\x1b[31m\\x7f");
}

TEST(RecordTextTest, ControlCharactersAboveAsciiAreEscapedToo) {
  EXPECT_EQ(marked("a\xC2\x9B z \xC2\x80\xC2\x9F\xC2\xA0"), "a\\x9b z \\x80\\x9f\xC2\xA0");
  EXPECT_EQ(marked("§ Größe °C 名 😀"), "§ Größe °C 名 😀");
  EXPECT_EQ(marked("cut \xC2"), "cut \xC2");
}

TEST(RecordTextTest, EveryByteIsTreatedAlikeAtEveryPlace) {
  // The text is looked at in blocks of several sizes; no byte may be judged by its place or its neighbours.
  constexpr std::size_t kLength = 32 + 8 + 3;
  for (int byte = 0; byte < 256; ++byte) {
    if (byte == 0xC2) continue;  // depends on what follows
    const auto c = static_cast<char>(byte);
    const std::string alone = marked(std::string(1, c));
    for (std::size_t place = 0; place < kLength; ++place) {
      for (const char neighbour : {'a', '\x20', '\x7e', '\xC3', '\xff', '\x80'}) {
        std::string text(kLength, neighbour);
        text[place] = c;
        EXPECT_EQ(marked(text),
                  std::string(place, neighbour) + alone + std::string(kLength - 1 - place, neighbour))
            << byte << " at " << place;
      }
    }
  }
}

TEST(RecordTextTest, APrefixGoesBeforeEachMark) {
  EXPECT_EQ(marked("a\nb\n", "<4>"), "a\n<4>    | b\n<4>    | ");
}

TEST(RecordTextTest, AsPartOfALineEvenLineBreaksAreEscaped) {
  std::string line;
  appendOneLine(line, "a\nb\n\x1b\tc");
  EXPECT_EQ(line, "a\\x0ab\\x0a\\x1b\tc");
}

TEST(RecordTextTest, RecordsAreFoundByTheirStart) {
  const std::string text = "1 a\n    | more\n2 b\n";
  EXPECT_EQ(nextRecordStart(text, 0), 15U);
  EXPECT_EQ(nextRecordStart(text, 14), 15U);
  EXPECT_EQ(nextRecordStart(text, 15), text.size());
  EXPECT_EQ(countRecords(text), 2U);
  EXPECT_EQ(countRecords(""), 0U);
}

TEST(RecordTimeTest, IsLocalTimeToTheMillisecond) {
  testing::ManualRunLoop clock;
  RecordTime time(clock);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:07.251");
  clock.advance(748ms);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:07.999");
  clock.advance(1ms);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:08.000");
  clock.advance(999us);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:08.000");
}

TEST(RecordTimeTest, FollowsAWallClockThatJumps) {
  testing::ManualRunLoop clock;
  RecordTime time(clock);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:07.251");
  time.forget();
  clock.setWall(WallTime{-1ms});
  EXPECT_EQ(time.nowText(), "1970-01-01 01:59:59.999");
  time.forget();
  clock.setWall(WallTime{std::chrono::seconds{253402300799 - 7200}});
  EXPECT_EQ(time.nowText(), "9999-12-31 23:59:59.000");
}

TEST(RecordTimeTest, OfAFloodEverySixteenthRecordAsksTheClock) {
  testing::ManualRunLoop clock;
  RecordTime time(clock);
  EXPECT_EQ(time.nowText(), "2024-05-02 14:03:07.251");
  clock.setWall(WallTime{-1ms});
  for (int call = 2; call <= 16; ++call) EXPECT_EQ(time.nowText(), "2024-05-02 14:03:07.251");
  EXPECT_EQ(time.nowText(), "1970-01-01 01:59:59.999");
}

}  // namespace
}  // namespace zal
