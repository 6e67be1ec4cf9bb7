#include "platform/linux/blackbox/record_frame.h"

#include <gmock/gmock.h>

#include <random>

#include "fuzz/record_content.h"

namespace zal {
namespace {

using ::testing::ElementsAre;

constexpr std::uint32_t kSeed = 0x5eed1234;
constexpr std::size_t kWidth = 64;

class RecordFrameTest : public ::testing::Test {
 protected:
  /// Pieces of several lengths, one of them a whole frame of another file.
  RecordFrameTest() {
    std::string foreign;
    appendRecordFrame(foreign, kSeed + 1, "of another file");
    pieces = {"first", "", std::string(5, '\0'), foreign, std::string(100, 'x'), "last"};
    for (const std::string& piece : pieces) {
      begins.push_back(bytes.size());
      appendRecordFrame(bytes, kSeed, piece);
    }
  }
  static std::vector<std::string> readPieces(const std::string& content) {
    return readThroughWindow(content, kSeed, kWidth).pieces;
  }
  static std::uint64_t unreadable(const std::string& content) {
    return readThroughWindow(content, kSeed, kWidth).unreadableBytes;
  }
  void expectTheSameThroughAnyWindow(const std::string& content) const {
    const RecordContent whole = readAsWritten(content, kSeed);
    for (const std::size_t width : {1, 7, 16, 17, 40, 100, 1000}) {
      ASSERT_EQ(readThroughWindow(content, kSeed, width), whole) << width;
    }
  }
  [[nodiscard]] std::size_t endOf(std::size_t piece) const {
    return piece + 1 < begins.size() ? begins[piece + 1] : bytes.size();
  }

  std::vector<std::string> pieces;
  std::vector<std::size_t> begins;
  std::string bytes;
};

TEST_F(RecordFrameTest, PiecesAreReadAsTheyWereWritten) {
  EXPECT_EQ(readPieces(bytes), pieces);
  EXPECT_EQ(unreadable(bytes), 0U);
}

TEST_F(RecordFrameTest, TheLayoutIsTheOneThatIsWrittenDown) {
  std::string one;
  appendRecordFrame(one, 0, "piece");
  ASSERT_EQ(one.size(), 21U);
  EXPECT_EQ(one.substr(0, 8), std::string("ZR\xB1\x01\x05\0\0\0", 8));
  EXPECT_EQ(one.substr(16), "piece");
}

TEST_F(RecordFrameTest, ATornTailIsCutAtTheLastWholePieceWhereverItIsTorn) {
  for (std::size_t size = 0; size <= bytes.size(); ++size) {
    std::size_t whole = 0;
    while (whole < pieces.size() && endOf(whole) <= size) ++whole;
    EXPECT_EQ(readPieces(bytes.substr(0, size)), std::vector(pieces.begin(), pieces.begin() + whole)) << size;
  }
}

TEST_F(RecordFrameTest, AFlippedByteAnywhereCostsTheDamagedPieceAloneAndIsCounted) {
  for (std::size_t at = 0; at < bytes.size(); ++at) {
    for (const int flip : {0x01, 0x80, 0xFF}) {
      std::string damaged = bytes;
      damaged[at] = static_cast<char>(damaged[at] ^ flip);
      std::size_t piece = 0;
      while (endOf(piece) <= at) ++piece;
      std::vector<std::string> others = pieces;
      others.erase(others.begin() + static_cast<std::ptrdiff_t>(piece));
      ASSERT_EQ(readPieces(damaged), others) << at;
      // The zeros at the very end of a file may be room that was never written.
      const bool endsInZeros = piece + 1 == pieces.size() && damaged.back() == '\0';
      ASSERT_EQ(unreadable(damaged), endsInZeros ? unreadable(damaged) : endOf(piece) - begins[piece]) << at;
    }
  }
}

TEST_F(RecordFrameTest, ALostStretchInTheMiddleLosesWhatItTouches) {
  std::string damaged = bytes;
  const std::size_t begin = begins[1] + 3;
  const std::size_t end = begins[3] + 3;
  std::fill(damaged.begin() + static_cast<std::ptrdiff_t>(begin),
            damaged.begin() + static_cast<std::ptrdiff_t>(end), '\0');
  EXPECT_THAT(readPieces(damaged), ElementsAre("first", pieces[4], "last"));
  EXPECT_EQ(unreadable(damaged), begins[4] - begins[1]);
}

TEST_F(RecordFrameTest, RoomThatWasNeverWrittenIsNoDamage) {
  EXPECT_EQ(readPieces(bytes + std::string(5000, '\0')), pieces);
  EXPECT_EQ(unreadable(bytes + std::string(5000, '\0')), 0U);
}

TEST_F(RecordFrameTest, AnotherFilesPiecesAreNone) {
  EXPECT_EQ(readThroughWindow(bytes, kSeed + 7, kWidth), (RecordContent{{}, bytes.size()}));
}

TEST_F(RecordFrameTest, AFileOfBeginningsIsReadInOneGo) {
  std::string beginnings;
  for (int i = 0; i < 200'000; ++i) beginnings.append("ZR\xB1\x01\xF0\xFF\x0F\0", 8);
  EXPECT_THAT(readPieces(beginnings + bytes), ::testing::ElementsAreArray(pieces));
  EXPECT_EQ(unreadable(beginnings + bytes), beginnings.size());
}

TEST_F(RecordFrameTest, FramesAcrossEveryEndOfTheWindowAreReadAsFromTheWholeFile) {
  for (std::size_t before = 0; before < 130; ++before) {
    expectTheSameThroughAnyWindow(std::string(before, 'Z') + bytes + std::string(before, '\0'));
  }
}

TEST_F(RecordFrameTest, AnyDamageIsReadAsFromTheWholeFile) {
  std::mt19937 random{3};
  for (int round = 0; round < 2000; ++round) {
    std::string damaged = bytes + bytes;
    for (auto blows = 1 + random() % 3; blows > 0; --blows) {
      const std::size_t at = random() % damaged.size();
      const std::size_t size = std::min<std::size_t>(random() % 40, damaged.size() - at);
      switch (random() % 4) {
        case 0:
          damaged.replace(at, size, size, '\0');
          break;
        case 1:
          damaged.erase(at, size);
          break;
        case 2:
          damaged.insert(at, bytes.substr(random() % bytes.size(), size));
          break;
        default:
          damaged[at] = static_cast<char>(random());
      }
    }
    expectTheSameThroughAnyWindow(damaged);
  }
}

TEST_F(RecordFrameTest, NoMoreIsHeldThanTheWindowOrTheLongestPiece) {
  std::string large;
  for (int copy = 0; copy < 50; ++copy) large += bytes + std::string(300, 'Z');
  const auto mostAtOnce = [&large](std::size_t width) {
    std::size_t most = 0;
    RecordWindow window(large.size(), width, [&](std::uint64_t offset, char* buffer, std::size_t size) {
      most = std::max(most, size);
      large.copy(buffer, size, offset);
    });
    readRecordFrames(window, kSeed, [](std::string_view) {});
    return most;
  };
  EXPECT_LE(mostAtOnce(256), 256U);
  EXPECT_LE(mostAtOnce(16), kRecordFrameHeaderSize + 100);
}

}  // namespace
}  // namespace zal
