#include <cstring>
#include <random>

#include "tests/e2e/dump_fixture.h"
#include "tests/e2e/small_disk.h"

namespace zal {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using testing::RawClient;
using ::testing::SizeIs;

/// The logs and reports on a file system of four mebibytes.
class FullDiskE2eTest : public testing::DumpFixture {
 protected:
  void SetUp() override {
    if (disk.error() != 0) GTEST_SKIP() << "a tmpfs cannot be mounted here: " << std::strerror(disk.error());
    sandbox.stateRoot = sandbox / "disk";
  }
  testing::SmallDisk disk{sandbox / "disk", "4m"};
};

TEST_F(FullDiskE2eTest, TheAgentLivesOnSaysSoAndWritesAgainWhenThereIsRoom) {
  start();
  RawClient client(sandbox.socketPath());
  client.sendLog("Disk", "before");
  ASSERT_TRUE(client.barrier());
  disk.fill();
  const std::string longText(3000, 'y');
  for (int i = 0; i < 10; ++i) client.sendLog("Disk", longText);
  ASSERT_TRUE(client.barrier());
  client.beginSession("Vistel");
  for (const char* text : {"one", "two"}) client.sendCheckpoint("Vistel", text, 1714651388.0);
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(output(), HasSubstr("No space left on device"));
  EXPECT_THAT(output(), HasSubstr("/Disk/Disk.log"));
  disk.makeRoom();
  client.sendLog("Disk", "after");
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(sandbox.wholeLogSet("Disk"), EndsWith("[test:e2e] after\n"));
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("End Session"));
}

/// Text that no compression makes much smaller.
std::string noise(std::size_t bytes) {
  std::mt19937_64 random(20261121);
  std::string text;
  while (text.size() < bytes) text += static_cast<char>('!' + random() % 90);
  return text;
}

TEST_F(FullDiskE2eTest, AFileFromAnotherFileSystemIsWholeInTheSessionsDirectoryBeforeTheAgentEnds) {
  start();
  const std::string content = noise(2'000'000);
  testing::writeFile(sandbox / "capture.pcap", content);
  {
    lirra::Client client = makeClient();
    client.beginSession("Vistel");
    for (const char* text : {"one", "two"}) client.checkpoint("Vistel", text, 1714651388.0);
    client.addLogFile("Vistel", "Captures", sandbox / "capture.pcap");
    ASSERT_EQ(client.flush(kReplyLimit), LIRRA_OK);
  }
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_FALSE(std::filesystem::exists(sandbox / "capture.pcap"));
  const std::string captures = sandbox.sessionDirectory("Vistel") + "/Captures";
  EXPECT_EQ(testing::listTree(captures), "capture.pcap\n");
  EXPECT_TRUE(testing::readFile(captures + "/capture.pcap") == content);
}

TEST_F(FullDiskE2eTest, ADumpThatFindsNoRoomForItsArchiveStaysAsItIsAndSaysSo) {
  start();
  const std::string content = noise(1'000'000);
  testing::writeFile(sandbox.logRoot() + "/Vistel/Vistel.log", content);
  disk.fill(200'000);
  lirra::Client client = makeClient();
  const std::string archive = archiveOf(client, ask(client, "Vistel", 0));
  EXPECT_THAT(archive, EndsWith(".zip"));  // where it would have been
  EXPECT_FALSE(std::filesystem::exists(archive));
  ASSERT_THAT(reportsEndingWith(" (not archived)"), SizeIs(1));
  const std::string kept = reportsEndingWith(" (not archived)")[0];
  EXPECT_EQ(kept, archive.substr(0, archive.size() - 4) + " (not archived)");
  EXPECT_EQ(testing::readFile(kept + "/Vistel/Vistel.log"), content);
  EXPECT_EQ(testing::readFile(kept + "/Reason.txt"), "Vistel");
  EXPECT_THAT(output(), HasSubstr("No space left on device"));
  ASSERT_THAT(records(), SizeIs(1));
  EXPECT_EQ(records()[0].record.state, DumpProgressRecord::State::failed);
}

TEST_F(FullDiskE2eTest, ADumpOnADiskWithoutAnyRoomIsAnsweredAndLosesNothing) {
  start();
  const std::string content = noise(300'000);
  testing::writeFile(sandbox.logRoot() + "/Vistel/Vistel.log", content);
  disk.fill();
  lirra::Client client = makeClient();
  const std::string archive = archiveOf(client, ask(client, "Vistel", 0x0E));
  EXPECT_NE(archive, "");
  EXPECT_FALSE(std::filesystem::exists(archive));
  EXPECT_EQ(testing::readFile(sandbox.logRoot() + "/Vistel/Vistel.log"), content);
  disk.makeRoom();
  const std::string next = archiveOf(client, ask(client, "Messages", 0));
  EXPECT_THAT(entriesOf(next), ::testing::Contains("Reason.txt"));
}

}  // namespace
}  // namespace zal
