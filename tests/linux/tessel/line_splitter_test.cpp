#include "platform/linux/tessel/line_splitter.h"

#include <gtest/gtest.h>

namespace zal::tessel {
namespace {

/// Every line that is whole by now, each in brackets.
std::string lines(LineSplitter& splitter) {
  std::string all;
  while (const auto line = splitter.next()) all += "[" + std::string(*line) + "]";
  return all;
}

TEST(LineSplitterTest, LinesComeWholeWhateverThePieces) {
  const std::string text = "one\n\ntwo\nthr";
  for (std::size_t piece = 1; piece <= text.size(); ++piece) {
    LineSplitter splitter;
    std::string all;
    for (std::size_t at = 0; at < text.size(); at += piece) {
      splitter.add(std::string_view(text).substr(at, piece));
      all += lines(splitter);
    }
    EXPECT_EQ(all, "[one][][two]") << piece;
    EXPECT_EQ(splitter.takeRest(), "thr") << piece;
  }
}

TEST(LineSplitterTest, LineThatWasBegunUnseenIsPassedOver) {
  LineSplitter splitter;
  splitter.skipBrokenLine();
  splitter.add("end of a li");
  EXPECT_EQ(lines(splitter), "");
  splitter.add("ne\nwhole\n");
  EXPECT_EQ(lines(splitter), "[whole]");
}

TEST(LineSplitterTest, EndlessLineComesInPieces) {
  LineSplitter splitter;
  const std::string longest(LineSplitter::kLongestLine, 'x');
  splitter.add(longest);
  EXPECT_EQ(splitter.next(), std::nullopt);
  splitter.add("yz\nnext\n");
  EXPECT_EQ(splitter.next(), longest);
  EXPECT_EQ(lines(splitter), "[yz][next]");
}

}  // namespace
}  // namespace zal::tessel
