#include <gmock/gmock.h>
#include <malloc.h>
#include <unistd.h>

#include <filesystem>

#include "agent/agent_entry.h"
#include "agent/zal_logging_agent_server.h"
#include "tests/support/fake_platform.h"
#include "tests/support/process_size.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using testing::filesBelow;
using testing::ProcessSize;
using testing::soakLength;

/// What one day leaves behind.
struct Footprint {
  std::size_t heap = 0;  ///< bytes in use
  ProcessSize process;
  std::uint64_t files = 0;  ///< outside of the reports
  std::size_t timers = 0;
};

/// One agent that is never left alone for six minutes, for a week of its clock, with everything behind the
/// server real but the host.
class SimulatedWeekTest : public ::testing::Test {
 protected:
  static constexpr int kDays = 2;
  static constexpr int kCallsAnHour = 10;

  SimulatedWeekTest() {
    ZalLoggingAgentServer::resetSharedInstanceForTests();
    fake.preferences.stored["CallLogging"] = true;
    runAgent(fake.platform);
  }
  ~SimulatedWeekTest() override { ZalLoggingAgentServer::resetSharedInstanceForTests(); }

  static ZalLoggingAgentServer& server() { return *ZalLoggingAgentServer::sharedInstance(); }

  void pass(std::chrono::seconds duration) {
    for (; duration > 0s; duration -= 30s) {
      fake.host.advance(std::min(duration, 30s));
      fake.queues.runAll();
    }
  }
  double now() const { return secondsSinceEpoch(fake.host.wallNow()); }

  void call(int number) {
    const std::string type = number % 3 == 0 ? "Nexa" : "Vistel";
    server().beginSession(type, "caller", number % 2 == 0 ? kBeginFlagInitiator : 0, number % 7 == 0 ? 1 : 0);
    for (int step = 0; step < 8; ++step) {
      server().noteCheckpoint("Step", type, now(), "caller");
      server().logDescription("Offer", "v=0\ns=call " + std::to_string(number), type, "caller", now());
      server().addCallMetric("rtt", Number{20.5 + step}, type, "caller");
      server().logCallQuality("sample", "loss 0", type, "media");
      pass(30s);
    }
    if (number % 5 == 0) server().noteFailureReason("Timeout", type, "caller");
    server().endSession(type, "caller");
    pass(120s);
    ++calls;
  }
  void flood() {
    for (int number = 0; number < 5000; ++number) {
      server().log({.text = "a line of a daemon that has much to say", .sender = "noisy"});
    }
  }
  void dump() {
    server().performAction(14, "Vistel", "caller", peer, &message,
                           &(info = {{"displayFlags", std::int64_t{4}}}));
    pass(60s);
    ++dumps;
  }
  void jump(int hour) {
    // By odd seconds: an archive whose name is taken, by a call of that very second, is kept elsewhere.
    fake.host.setWall(fake.host.wallNow() + (hour % 2 == 0 ? 3h + 17s : -3h - 11s));
    if (hour % 12 != 5) return;
    server().beginSession("Slept", "caller", 0, 0);
    server().noteCheckpoint("before", "Slept", now(), "caller");
    fake.host.sleep(200s);
    fake.queues.runAll();
    server().endSession("Slept", "caller");
    pass(10s);
    ++calls;
  }

  void day() {
    for (int hour = 0; hour < 24; ++hour) {
      for (int number = 0; number < kCallsAnHour; ++number) call(number);
      if (hour % 6 == 3) dump();
      if (hour % 4 == 2) flood();
      if (hour % 3 == 2) jump(hour);
    }
  }
  /// What the fakes noted goes, as does what a person would have taken away.
  void cleanUp() {
    fake.agentLog.lines = {};
    fake.logFacility.records = {};
    fake.shell.commands = {};
    fake.preferences.readKeys = {};
    fake.systemNotifications.posts = {};
    fake.crashReporter.stackshots = {};
    fake.crashReporter.stackshotCodes = {};
    fake.crashReporter.crashes = {};
    fake.telephony.asked = {};
    fake.telephony.basebandDumps = {};
    fake.networkStatus.waiting = {};
    fake.userAlerts.posted = {};
    fake.fileCopier.started = {};
    fake.fileCopier.endings = {};
    fake.wifiDiagnostics.taken = {};
    fake.propertyLists.written = {};
    fake.dumpProgress.lines = {};
    fake.dumpProgress.plans = {};
    fake.pings.tests = {};
    for (const auto& record : fake.sessionRecords.records) EXPECT_TRUE(record->isRemoved);
    fake.sessionRecords.records = {};
    fakePeer->replies = {};
    message.readKeys = {};
    std::filesystem::remove_all(fake.configuration.roots.DiagnosticReportRoot);
  }
  Footprint footprint() {
    return {::mallinfo2().uordblks, ProcessSize::of(::getpid()), filesBelow(fake.home.path()),
            fake.host.pendingTimers()};
  }

  int calls = 0, dumps = 0;
  testing::FakePlatform fake;
  std::shared_ptr<testing::FakePeer> fakePeer = std::make_shared<testing::FakePeer>();
  std::shared_ptr<PeerConnection> peer = fakePeer;
  testing::FakeMessage message;
  ValueMap info;
};

TEST_F(SimulatedWeekTest, LeavesTheAgentAsLargeAsItsFirstDayDid) {
  message.token = 77;
  std::vector<Footprint> days;
  const int length = soakLength("ZAL_SOAK_DAYS", 2);
  for (int number = 0; number < length; ++number) {
    day();
    EXPECT_GT(filesBelow(fake.configuration.roots.DiagnosticReportRoot), 0U);
    cleanUp();
    days.push_back(footprint());
    std::printf("day %d: %zu bytes in use, %llu files, %zu timers\n", number + 1, days.back().heap,
                static_cast<unsigned long long>(days.back().files), days.back().timers);
  }
  const Footprint &first = days.front(), &last = days.back();
  EXPECT_LE(last.heap, first.heap + (64U << 10U));
  EXPECT_EQ(last.process.descriptors, first.process.descriptors);
  EXPECT_EQ(last.process.threads, first.process.threads);
  EXPECT_EQ(last.files, first.files);
  EXPECT_EQ(last.timers, first.timers);
  EXPECT_EQ(dumps, length * 4);
  std::printf("%d calls, %d dumps\n", calls, dumps);

  // And when the week is over, six quiet minutes end it.
  pass(12min);
  EXPECT_THAT(fake.processExit.exits, ::testing::ElementsAre(0));
}

}  // namespace
}  // namespace zal
