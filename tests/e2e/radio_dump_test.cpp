#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/e2e/dump_fixture.h"
#include "tests/support/private_bus.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

/// What a dump takes of the radios through the agent's own helper programs.
class RadioDumpE2eTest : public DumpFixture {};

TEST_F(RadioDumpE2eTest, TheBasebandsStateOfThisDumpIsInItsArchive) {
  if (const std::string obstacle = PrivateBus::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  const PrivateBus bus;
  const MockedService modemManager(bus, "org.freedesktop.ModemManager1",
                                   {"-m", "dbusmock", "-t", ZAL_MODEMDUMP_MOCKS "/modem_manager_mock.py",
                                    "-p", "{\"levels\": \"" + sandbox / "levels" + "\"}"});
  sandbox.bus = bus.address();
  start();
  lirra::Client client = makeClient();
  const std::string archive = archiveOf(client, ask(client, "Vistel", 0x04));
  std::vector<std::string> states;
  for (const std::string& entry : entriesOf(archive)) {
    if (entry.starts_with("Baseband Logs/Baseband/modemd-") && entry.ends_with("-state.json"))
      states.push_back(entry);
  }
  ASSERT_EQ(states.size(), 1U) << output();
  EXPECT_THAT(textIn(archive, states[0]), HasSubstr("\"/org/freedesktop/ModemManager1/Modem/0\": {"));
  EXPECT_FALSE(std::filesystem::exists(marker()));
  EXPECT_EQ(readFile(sandbox / "levels"), "DEBUG\nINFO\n");
}

TEST_F(RadioDumpE2eTest, WifiDiagnosticsLieWhereTheNetworkDumpTakesThemFrom) {
  start();
  lirra::Client client = makeClient();
  EXPECT_NE(archiveOf(client, ask(client, "Vistel", 0x4000)), "");
  EXPECT_THAT(readFile(sandbox / "system/DiagnosticReports/WiFi/wifidump-note.txt"),
              HasSubstr("reason: Vistel\n"))
      << output();
}

}  // namespace
}  // namespace zal::testing
