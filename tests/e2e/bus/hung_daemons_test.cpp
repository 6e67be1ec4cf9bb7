#include <regex>

#include "tests/e2e/bus/bus_e2e_fixture.h"
#include "tests/e2e/bus/knocking_client.h"
#include "tests/e2e/bus/quality_log.h"
#include "tests/support/wait_watch.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class HungDaemonsE2eTest : public BusE2eFixture {
 protected:
  std::size_t linesWith(const std::string& words) const {
    const auto lines = linesOf(output());
    return static_cast<std::size_t>(std::count_if(lines.begin(), lines.end(), [&](const std::string& line) {
      return line.find(words) != std::string::npos;
    }));
  }
  void startAll() {
    startModem({"csq=20"});
    startWifi(kSignal);
  }
  /// Two more samples: at least one began after the call.
  void waitForBeats() { waitForPolls(wifi->polls() + 2); }

  /// Runs the step, during which the agent answers requests and its main thread waits in its loop alone.
  void expectPrompt(KnockingClient& knocking, const std::string& name, const std::function<void()>& step) {
    const WaitWatch waits(agent->processId(), agent->processId());
    const std::size_t before = knocking.answers();
    step();
    EXPECT_GT(knocking.answers(), before) << name;
    waits.awaitLook();
    EXPECT_EQ(waits.strayWaits(), 0U) << name;
  }

  static constexpr PlayedWifi::Signal kSignal{.strength = 70, .rssi = -58, .rate = 433};
};

TEST_F(HungDaemonsE2eTest, ADaemonThatHangsAndABusThatDiesHoldUpNobodyAndLeaveASessionWhole) {
  startAll();
  start();
  lirra::Client client = makeClient();
  client.beginSession("Vistel");
  client.checkpoint("Vistel", "Connected", 1714651381.5);
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  waitForPolls(1);
  KnockingClient knocking(sandbox.socketPath());

  expectPrompt(knocking, "a modem daemon that hangs", [&] {
    modemManager->hang();
    waitForBeats();
    modemManager->goOn();
    ASSERT_TRUE(
        eventually([&] { return linesWith("The cellular signal is sampled again") == 1; }, kDeadline));
  });
  client.checkpoint("Vistel", "After the daemon hung", 1714651382.5);

  expectPrompt(knocking, "a bus that dies", [&] {
    bus->kill();
    ASSERT_TRUE(eventually([&] { return linesWith("The system bus is lost: ") == 1; }, kDeadline));
    modemManager.reset();
    wifi.reset();
    bus->start();
    startAll();
    ASSERT_TRUE(eventually([&] { return linesWith("The system bus is back") == 1; }, kDeadline));
    modem->set({"csq=8"});
    ASSERT_TRUE(eventually([&] { return percentage() == 40; }, kDeadline));
    waitForBeats();
  });
  client.checkpoint("Vistel", "After the bus died", 1714651383.5);
  client.endSession("Vistel");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  ASSERT_TRUE(eventually([&] { return !sandbox.sessionFile("Vistel", "Quality Log").empty(); }, kDeadline));
  // One barrier more: the files of an end are written in one turn of the agent.
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);

  for (const char* file : {"Log", "Verbose Log"}) {
    std::vector<std::string> told;
    for (const std::string& line : linesOf(withoutTimes(sandbox.sessionFile("Vistel", file)))) {
      if (line.starts_with("[Sender: caller]")) told.push_back(line);
    }
    EXPECT_EQ(told,
              (std::vector<std::string>{
                  "[Sender: caller] Connected   [TIME]", "[Sender: caller] After the daemon hung   [TIME]",
                  "[Sender: caller] After the bus died   [TIME]", "[Sender: caller] Begin Session  [TIME]",
                  "[Sender: caller] End Session  [TIME]"}))
        << file;
  }
  const QualityLog log = readQualityLog(sandbox.sessionFile("Vistel", "Quality Log"));
  for (const auto& [metric, samples] : log.samples) {
    ASSERT_TRUE(log.statistics.contains(metric)) << metric;
    expectSame(log.statistics.at(metric), statisticsOf(samples), metric);
  }
  // The last one is of the daemons that came back.
  ASSERT_TRUE(log.samples.contains("cell-signal-percentage"));
  EXPECT_EQ(log.samples.at("cell-signal-percentage").back(), 40);
  EXPECT_EQ(log.samples.at("wifi-signal-strength").back(), kSignal.strength);
  // One line for each, not one a beat. On a host without time for it the daemon may hang of itself as well.
  EXPECT_EQ(linesWith("The system bus is lost"), 1U);
  bool isWithout = false;
  for (const std::string& line : linesOf(output())) {
    const bool goes = line.find("Without the cellular signal: ") != std::string::npos;
    const bool comesBack = line.find("The cellular signal is sampled again") != std::string::npos;
    if (!goes && !comesBack) continue;
    EXPECT_NE(goes, isWithout) << output();
    isWithout = goes;
  }
  EXPECT_EQ(agent->terminate(), 0);
}

}  // namespace
}  // namespace zal::testing
