#include "session/sorted_log_list.h"

#include <gtest/gtest.h>

#include <cmath>

#include <bit>
#include <limits>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace zal {
namespace {

using Texts = std::vector<std::string>;

Texts textsOf(const LogLines& copy) { return {copy.lines.begin(), copy.lines.end()}; }

class SortedLogListTest : public ::testing::Test {
 protected:
  _ZalLoggingAgentSessionSortedLogList list;
  Texts texts() const { return textsOf(list.copySortedLogList()); }
};

TEST_F(SortedLogListTest, OrdersEntriesByTime) {
  list.addLog("five", 5);
  list.addLog("three", 3);
  list.addLog("four", 4);
  EXPECT_EQ(texts(), (Texts{"three", "four", "five"}));
}

TEST_F(SortedLogListTest, PutsTheLaterOfEqualTimesFirst) {
  list.addLog("W", 7);
  list.addLog("X", 7);
  EXPECT_EQ(texts(), (Texts{"X", "W"}));
}

TEST_F(SortedLogListTest, PlacesLaterAndEarlierEntriesAroundEqualOnes) {
  list.addLog("W", 7);
  list.addLog("X", 7);
  list.addLog("Y", 8);
  EXPECT_EQ(texts(), (Texts{"X", "W", "Y"}));
  list.addLog("Z", 6);
  EXPECT_EQ(texts(), (Texts{"Z", "X", "W", "Y"}));
}

TEST_F(SortedLogListTest, KeepsPrependedLinesAheadInTheirOwnOrder) {
  list.addLog("timed", -1e300);
  list.addLog("later", 5);
  list.prependLog("H1");
  list.prependLog("H2");
  EXPECT_EQ(texts(), (Texts{"H1", "H2", "timed", "later"}));
}

TEST_F(SortedLogListTest, CountsPrependedAndTimedLinesUntilEmptied) {
  for (const char* header : {"a", "b"}) list.prependLog(header);
  for (const double time : {1.0, 2.0, 3.0}) list.addLog("line", time);
  EXPECT_EQ(list.count(), 5U);
  list.removeAllObjects();
  EXPECT_EQ(list.count(), 0U);
  EXPECT_EQ(texts(), Texts{});
}

TEST_F(SortedLogListTest, CopiesANeverUsedListAsEmpty) { EXPECT_EQ(texts(), Texts{}); }

TEST_F(SortedLogListTest, PutsATimeThatIsNoNumberFirst) {
  list.addLog("a", 1);
  list.addLog("b", 2);
  list.addLog("nan", std::nan(""));
  EXPECT_EQ(texts(), (Texts{"nan", "a", "b"}));
}

TEST_F(SortedLogListTest, KeepsACopyAliveWhenTheListIsEmptiedAndReused) {
  list.addLog("kept", 2);
  const LogLines copy = list.copySortedLogList();
  list.addLog("also", 1);
  list.removeAllObjects();
  list.addLog("new", 1);
  EXPECT_EQ(textsOf(copy), Texts{"kept"});
  EXPECT_EQ(texts(), Texts{"new"});
}

TEST_F(SortedLogListTest, KeepsTextsAsTheyAre) {
  const std::string large(1'000'000, 'x');
  list.addLog(" \n", 1);
  list.addLog(std::string_view("a\0b", 3), 2);
  list.addLog("", 3);
  list.addLog(large, 4);
  EXPECT_EQ(texts(), (Texts{" \n", std::string("a\0b", 3), "", large}));
}

/// The list as it is described: a scan from the end for the first strictly smaller time.
class ScannedList {
 public:
  void add(const std::string& text, double time) {
    for (int i = static_cast<int>(_entries.size()) - 1; i >= 0; --i) {
      if (_entries[static_cast<std::size_t>(i)].second < time) {
        _entries.insert(_entries.begin() + i + 1, {text, time});
        return;
      }
    }
    _entries.insert(_entries.begin(), {text, time});
  }
  void prepend(const std::string& text) { _prepended.push_back(text); }
  [[nodiscard]] Texts texts() const {
    Texts all = _prepended;
    for (const auto& entry : _entries) all.push_back(entry.first);
    return all;
  }

 private:
  std::vector<std::pair<std::string, double>> _entries;
  Texts _prepended;
};

class SortedLogListAgainstScan : public ::testing::TestWithParam<unsigned> {
 protected:
  std::mt19937_64 random{GetParam() * 7919ULL + 1};
  _ZalLoggingAgentSessionSortedLogList list;
  ScannedList scan;
  int number = 0;

  void add(double time) {
    const std::string text = std::to_string(number++);
    list.addLog(text, time);
    scan.add(text, time);
  }
  void expectSame() const { ASSERT_EQ(textsOf(list.copySortedLogList()), scan.texts()); }
  std::size_t below(std::size_t limit) { return random() % limit; }
};

TEST_P(SortedLogListAgainstScan, FewDistinctAndHostileTimesComeOutAsScanned) {
  constexpr double kBoundless = std::numeric_limits<double>::infinity();
  const double times[] = {std::nan(""), kBoundless, -kBoundless,      0.0,    -0.0, 1.0, 2.0, -std::nan(""),
                          -1.0,         1e308,      5e-324 /*least*/, -5e-324};
  const std::size_t distinct = 1 + below(std::size(times));
  const std::size_t first = below(std::size(times));
  for (int step = 0; step < 400; ++step) {
    add(times[(first + below(distinct)) % std::size(times)]);
    if (below(40) == 0) {
      list.prependLog("header");
      scan.prepend("header");
    }
    if (below(20) == 0) expectSame();  // a copy between insertions changes nothing
  }
  expectSame();
}

TEST_P(SortedLogListAgainstScan, ManyRandomTimesComeOutAsScanned) {
  for (int step = 0; step < 4000; ++step) {
    add(1714651387.0 + static_cast<double>(below(2000)) / 1000.0);
    if (below(500) == 0) add(std::nan(""));
  }
  expectSame();
}

TEST_P(SortedLogListAgainstScan, AnyBitsComeOutAsScanned) {
  for (int step = 0; step < 2500; ++step) add(std::bit_cast<double>(random()));
  expectSame();
}

TEST_P(SortedLogListAgainstScan, RunsComeOutAsScanned) {
  for (int run = 0; run < 12; ++run) {
    const double start = static_cast<double>(below(100));
    const double pace = static_cast<double>(below(3)) - 1.0;  // falling, equal, rising
    for (std::size_t i = 0; i < below(400) + 1; ++i) add(start + pace * static_cast<double>(i));
    expectSame();
  }
}

INSTANTIATE_TEST_SUITE_P(Seeds, SortedLogListAgainstScan, ::testing::Range(0U, 8U));

TEST_F(SortedLogListTest, TakesAMillionDescendingTimesInLinearTime) {
  // A quadratic list needs 5e11 steps for this: minutes at the very least.
  for (int i = 0; i < 1'000'000; ++i) list.addLog("x", -i);
  list.addLog("first", -2'000'000);
  EXPECT_EQ(list.copySortedLogList().lines.front(), "first");
}

}  // namespace
}  // namespace zal
