#include <csignal>
#include <cstring>

#include "tests/e2e/e2e_fixture.h"
#include "tests/e2e/small_disk.h"

namespace zal {
namespace {

using ::testing::EndsWith;
using testing::eventually;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using testing::linesOf;
using testing::RawClient;
using ::testing::SizeIs;
using ::testing::StartsWith;

constexpr double kTime = 1714651388.0;

/// Agents that are killed in the middle of a call, and those that come after them.
class BlackBoxE2eTest : public testing::E2eFixture {
 protected:
  [[nodiscard]] std::string directory() const { return sandbox / "home/kept/BlackBox"; }
  [[nodiscard]] std::vector<std::string> records() const {
    std::vector<std::string> names;
    std::error_code none;
    for (const auto& entry : std::filesystem::directory_iterator(directory(), none))
      names.push_back(entry.path());
    return names;
  }
  void killAgent() {
    agent->signal(SIGKILL);
    ASSERT_EQ(agent->waitForExit(), -SIGKILL);
  }
  /// The numbers of the entries in the session's verbose log, in order.
  [[nodiscard]] std::vector<int> entriesIn(const std::string& type) const {
    std::vector<int> numbers;
    for (const std::string& line : linesOf(sandbox.sessionFile(type, "Verbose Log"))) {
      const auto at = line.find("entry ");
      if (at != std::string::npos) numbers.push_back(std::stoi(line.substr(at + 6)));
    }
    return numbers;
  }
};

TEST_F(BlackBoxE2eTest, WhatAClientWasToldIsSafeOutlivesAKillOnceAndInOrder) {
  constexpr int kEntries = 2000;
  start();
  {
    RawClient client(sandbox.socketPath());
    client.beginSession("Vistel", 4);
    client.sendCheckpoint("Vistel", "Connected", kTime);
    for (int number = 0; number < kEntries; ++number) {
      client.sendDescription("Vistel", "entry " + std::to_string(number), kTime + number);
    }
    ASSERT_TRUE(client.barrier());
    killAgent();
  }
  ASSERT_THAT(records(), SizeIs(1));
  EXPECT_EQ(sandbox.sessionDirectory("Vistel"), "");

  start();
  EXPECT_THAT(sandbox.sessionDirectory("Vistel"), EndsWith(" (CEST) (Initiator)"));
  for (const char* name : {"Log", "Verbose Log", "Quality Log"}) {
    EXPECT_THAT(sandbox.sessionFile("Vistel", name), StartsWith("[Recovered: the agent was cut off after "));
    EXPECT_THAT(sandbox.sessionFile("Vistel", name), HasSubstr("[Sender: RECOVERED] End Session"));
  }
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("] Connected   ["));
  std::vector<int> all(kEntries);
  for (int number = 0; number < kEntries; ++number) all[number] = number;
  EXPECT_EQ(entriesIn("Vistel"), all);
  EXPECT_THAT(records(), IsEmpty());
  EXPECT_EQ(agent->terminate(), 0);
}

TEST_F(BlackBoxE2eTest, ATornEndAndADamagedMiddleCostNoMoreThanThemselves) {
  start();
  {
    RawClient client(sandbox.socketPath());
    client.beginSession("Vistel");
    for (int number = 0; number < 10; ++number) {
      client.sendDescription("Vistel", "entry " + std::to_string(number), kTime + number);
    }
    ASSERT_TRUE(client.barrier());
    killAgent();
  }
  ASSERT_THAT(records(), SizeIs(1));
  std::string bytes = testing::readFile(records()[0]);
  bytes[bytes.find("entry 4")] = '?';
  bytes.resize(bytes.size() - 1);
  testing::writeFile(records()[0], bytes);

  start();
  EXPECT_EQ(entriesIn("Vistel"), (std::vector<int>{0, 1, 2, 3, 5, 6, 7, 8}));
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr(" bytes of its record could not be read]\n"));
}

TEST_F(BlackBoxE2eTest, ASessionThatEndsNormallyLeavesNoRecordAndAnAgentWithoutOneMakesNothing) {
  start();
  RawClient client(sandbox.socketPath());
  ASSERT_TRUE(client.sendLog("Calls", "no session"));
  ASSERT_TRUE(client.barrier());
  EXPECT_FALSE(std::filesystem::exists(directory()));
  client.beginSession("Vistel");
  for (int number = 0; number < 3; ++number) client.sendCheckpoint("Vistel", "entry", kTime + number);
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(records(), SizeIs(1));
  client.endSession("Vistel");
  EXPECT_TRUE(eventually([&] { return records().empty(); }));
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("End Session"));
}

TEST_F(BlackBoxE2eTest, AnAgentThatIsToldToEndLeavesNoRecord) {
  sandbox.settings += "[blackbox]\nsync = true\n";
  start();
  RawClient client(sandbox.socketPath());
  client.beginSession("Vistel");
  for (int number = 0; number < 3; ++number) client.sendCheckpoint("Vistel", "entry", kTime + number);
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(records(), SizeIs(1));
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(records(), IsEmpty());
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("[Sender: ENDALL] End Session"));
}

TEST_F(BlackBoxE2eTest, SwitchedOffItKeepsNothing) {
  sandbox.settings += "[blackbox]\nenabled = false\n";
  start();
  RawClient client(sandbox.socketPath());
  client.beginSession("Vistel");
  client.sendCheckpoint("Vistel", "entry", kTime);
  ASSERT_TRUE(client.barrier());
  EXPECT_FALSE(std::filesystem::exists(directory()));
}

TEST_F(BlackBoxE2eTest, ADiskThatFillsUpInACallDoesNotSilenceItsLastMinute) {
  const testing::SmallDisk disk(sandbox / "home/kept", "2m");
  if (disk.error() != 0) GTEST_SKIP() << "a tmpfs cannot be mounted here: " << std::strerror(disk.error());
  constexpr int kEntries = 1000;
  start();
  {
    RawClient client(sandbox.socketPath());
    client.beginSession("Vistel");
    ASSERT_TRUE(client.barrier());
    disk.fill();
    const std::string more(150, 'x');
    for (int number = 0; number < kEntries; ++number) {
      client.sendDescription("Vistel", "entry " + std::to_string(number) + more, kTime + number);
    }
    ASSERT_TRUE(client.barrier());
    // Twice as much as was reserved: the rest is lost, and the call goes on.
    for (int number = 0; number < 100; ++number) {
      client.sendDescription("Vistel", "more " + std::string(10'000, 'x'), kTime);
    }
    ASSERT_TRUE(client.barrier());
    EXPECT_THAT(output(), HasSubstr("The black box takes no entries of a session"));
    killAgent();
  }
  start();
  EXPECT_THAT(entriesIn("Vistel"), SizeIs(kEntries));
}

}  // namespace
}  // namespace zal
