#include <unistd.h>

#include <cstring>
#include <random>

#include "tests/e2e/dump_fixture.h"
#include "tests/e2e/small_disk.h"

namespace zal {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::EndsWith;
using testing::eventually;
using ::testing::HasSubstr;
using testing::linesOf;
using ::testing::Not;
using ::testing::SizeIs;

/// Logs and reports on a disk of sixteen mebibytes, of which two may be kept.
class DiskBudgetE2eTest : public testing::DumpFixture {
 protected:
  void SetUp() override {
    if (disk.error() != 0) GTEST_SKIP() << "a tmpfs cannot be mounted here: " << std::strerror(disk.error());
    sandbox.stateRoot = sandbox / "disk";
    sandbox.diskSettings = "size = 2000000\nkeepFree = 5\n";
  }
  /// What the tool prints, run as the agent's user would.
  std::string lirractl(const std::string& arguments) const {
    std::string command = "env -i";
    for (const std::string& variable : sandbox.environment()) command += " '" + variable + "'";
    return outputOf(command + " " ZAL_LIRRACTL_PATH " " + arguments + " 2>&1");
  }
  void dump(const std::string& type, const std::string& description) const {
    lirractl("dump " + type + " --flags 0 --description '" + description + "'");
  }
  /// A log set of the type that takes so many bytes, in an archive too.
  void putLog(const std::string& type, std::size_t bytes) const {
    std::mt19937_64 random(20261121);
    std::string text;
    while (text.size() < bytes) text += static_cast<char>('!' + random() % 90);
    testing::writeFile(sandbox.logRoot() + "/" + type + "/" + type + ".log", text);
  }
  void call(const std::string& type, const std::string& failure) const {
    lirra::Client client = makeClient();
    client.beginSession(type);
    for (const char* step : {"Invite sent", "Ringing", "Given up"}) client.checkpoint(type, step);
    client.failureReason(type, failure);
    client.endSession(type);
    EXPECT_EQ(client.flush(kReplyLimit), LIRRA_OK);
  }
  [[nodiscard]] std::size_t evictions() const {
    std::size_t count = 0;
    for (const std::string& line : linesOf(output())) count += line.find(": Evicted ") != std::string::npos;
    return count;
  }

  testing::SmallDisk disk{sandbox / "disk", "16m"};
};

TEST_F(DiskBudgetE2eTest, DumpsEvictTheOldestOfTheirTypeAndSpareFailedCallsOtherTypesAndTheLatest) {
  start();
  putLog("Vistel", 400'000);
  call("Vistel", "no answer");
  ASSERT_TRUE(eventually([this] { return !reportsEndingWith(" (Receiver).zip").empty(); }));
  for (const char* name : {"first", "second"}) dump("Nexa", name);
  for (int number = 1; number <= 8; ++number) dump("Vistel", "number " + std::to_string(number));
  ASSERT_TRUE(eventually([this] { return evictions() >= 4; })) << output();

  EXPECT_THAT(output(), AllOf(HasSubstr("(number 1).zip (dump of Vistel, "),
                              HasSubstr("): more than 1.9 MiB are kept"), Not(HasSubstr("Could not evict"))));
  EXPECT_THAT(reportsEndingWith(" (Receiver).zip"), SizeIs(1));
  EXPECT_THAT(reportsEndingWith("(first).zip"), SizeIs(1));
  EXPECT_THAT(reportsEndingWith("(number 1).zip"), SizeIs(0));
  EXPECT_THAT(reportsEndingWith("(number 8).zip"), SizeIs(1));
  ASSERT_THAT(reportsEndingWith("(number 1).Manifest.json"), SizeIs(1));
  EXPECT_THAT(testing::readFile(reportsEndingWith("(number 1).Manifest.json")[0]),
              HasSubstr("\"service\": \"Vistel\""));

  const std::string shown = lirractl("disk");
  EXPECT_THAT(shown, AllOf(HasSubstr(" of 1.9 MiB ("), HasSubstr("\nTYPE "), HasSubstr("\nstub "),
                           HasSubstr("\nNothing would go now.\n")));
  EXPECT_LT(shown.find("\nVistel "), shown.find("\nNexa "));
  const std::string simulated = lirractl("disk --simulate");
  EXPECT_THAT(linesOf(simulated),
              Contains(AllOf(HasSubstr("(number 8).zip"), EndsWith("(the latest of its type)"))))
      << simulated;
}

TEST_F(DiskBudgetE2eTest, WithoutRoomADumpLeavesOutWhatIsBigAndVerifySaysSo) {
  start();
  disk.fill(1'000'000);  // and a twentieth of sixteen mebibytes shall stay free
  lirra::Client client = makeClient();
  const std::string archive = archiveOf(client, ask(client, "Registration", 0x8000));
  ASSERT_THAT(archive, EndsWith(".zip"));
  EXPECT_THAT(outputOf(ZAL_LIRRACTL_PATH " verify '" + archive + "' || true"),
              HasSubstr("  missing:\n    Location: over budget\n"));
}

TEST_F(DiskBudgetE2eTest, AStartEvictsWhatAFormerAgentLeftAndRemovesHalfMadeArchives) {
  const std::string half = sandbox.reportRoot() + "/.com.vendel.lirra-" + std::to_string(::geteuid()) +
                           "-0123456789abcdef0123456789abcdef/half.zip";
  const std::string damaged = sandbox / "home/kept/BlackBox/0123456789abcdef0123456789abcdef.session.damaged";
  testing::writeFile(half, "half");
  testing::writeFile(damaged, std::string(3'000'000, 'x'));
  start();
  EXPECT_TRUE(eventually([&] { return !std::filesystem::exists(half) && !std::filesystem::exists(damaged); }))
      << output();
}

}  // namespace
}  // namespace zal
