#include <gmock/gmock.h>

#include <sstream>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using ::testing::HasSubstr;

/// A call during which the host's clocks do what clocks do.
class JumpingTimeTest : public SessionFixture {
 protected:
  int becameInactive = 0;

  JumpingTimeTest() {
    fakes.localNotifications.observe("LirraLogSessionBecameInactiveNotification",
                                     [this](void*) { ++becameInactive; });
    session->beginSessionWithSender("caller");
  }
  void checkpoint(const std::string& text) {
    session->noteCheckpoint(text, secondsSinceEpoch(host.wallNow()), "caller");
  }
};

TEST_F(JumpingTimeTest, AWallClockSetBackByHoursLeavesInactivityWhereItWas) {
  host.setWall(host.wallNow() - 5h);
  host.advance(239'999ms);
  EXPECT_EQ(becameInactive, 0);
  host.advance(1ms);
  EXPECT_EQ(becameInactive, 1);
}

TEST_F(JumpingTimeTest, EntriesKeepTheirWallTimesOverAClockSetBackAndForward) {
  checkpoint("before");
  host.advance(1s);
  host.setWall(host.wallNow() - 2h);
  checkpoint("set back");
  host.advance(1s);
  host.setWall(host.wallNow() + 5h);
  checkpoint("set forward");
  host.advance(1s);
  session->endSessionWithSender("caller");
  EXPECT_THAT(simpleLog(), HasSubstr(R"([Sender: caller] set back   [12:03:08.251  (2024-05-02) (CEST)]
[Sender: caller] before   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] set forward   [17:03:09.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [17:03:10.251  (2024-05-02) (CEST)]
)"));
}

TEST_F(JumpingTimeTest, ACallOverWhichTheHostSleptIsInactiveWhenItWakes) {
  host.sleep(239'999ms);
  EXPECT_EQ(becameInactive, 0);
  checkpoint("still there");
  host.sleep(1h);
  EXPECT_EQ(becameInactive, 1);
}

TEST_F(JumpingTimeTest, ThePulseBeatsOnceForASleepAndGoesOnEveryFiveSeconds) {
  host.sleep(62s);
  host.advance(3s);
  session->endSessionWithSender("caller");
  // 62 seconds after the beginning, then on the grid of five that it had: after 65.
  std::string beats;
  std::istringstream lines(qualityLog());
  for (std::string line; std::getline(lines, line);) {
    if (line.find(" wifi-signal-rate: ") != std::string::npos) beats += line.substr(line.find("   [")) + '\n';
  }
  EXPECT_EQ(beats,
            "   [14:04:09.251  (2024-05-02) (CEST)]\n"
            "   [14:04:12.251  (2024-05-02) (CEST)]\n");
}

TEST_F(JumpingTimeTest, AZoneSetDuringTheCallChangesNoNameOfThatRun) {
  host.advance(1s);
  checkpoint("one");
  host.zone = "UTC";
  host.advance(1s);
  checkpoint("two");
  host.advance(1s);
  session->endSessionWithSender("caller");
  EXPECT_THAT(simpleLog(), HasSubstr("one   [14:03:08.251  (2024-05-02) (CEST)]\n"
                                     "[Sender: caller] two   [14:03:09.251  (2024-05-02) (CEST)]\n"));
}

}  // namespace
}  // namespace zal::testing
