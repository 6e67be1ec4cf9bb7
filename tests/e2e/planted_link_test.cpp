#include "tests/e2e/dump_fixture.h"

namespace zal {
namespace {

using testing::eventually;
using ::testing::HasSubstr;
using testing::listTree;
using testing::RawClient;
using testing::writeFile;

/// Links that somebody who may enter the roots has laid below them.
class PlantedLinkE2eTest : public testing::DumpFixture {
 protected:
  void plant(const std::string& place) {
    std::filesystem::create_directories(std::filesystem::path(place).parent_path());
    std::filesystem::create_directories(elsewhere);
    std::filesystem::create_directory_symlink(elsewhere, place);
  }
  const std::string elsewhere = sandbox / "elsewhere";
};

TEST_F(PlantedLinkE2eTest, ASessionWritesNothingThroughOneAndItsRecordWaitsUntilItIsGone) {
  plant(sandbox.reportRoot() + "/Vistel");
  start();
  RawClient client(sandbox.socketPath());
  client.beginSession("Vistel");
  for (const char* text : {"one", "two", "three"}) client.sendCheckpoint("Vistel", text, 1714651388.0);
  ASSERT_TRUE(client.barrier());
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(output(), HasSubstr("Could not write " + sandbox.reportRoot() + "/Vistel/"));
  EXPECT_THAT(output(), HasSubstr("Too many levels of symbolic links"));
  EXPECT_EQ(listTree(elsewhere), "");

  std::filesystem::remove(sandbox.reportRoot() + "/Vistel");
  start();
  ASSERT_TRUE(
      eventually([&] { return sandbox.sessionFile("Vistel", "Log").find("three") != std::string::npos; }));
  EXPECT_EQ(agent->terminate(), 0);
}

TEST_F(PlantedLinkE2eTest, ADumpIsRefusedAndALogSetWaits) {
  plant(sandbox.reportRoot() + "/Messages");
  plant(sandbox.logRoot() + "/Other");
  start();
  lirra::Client client = makeClient();
  client.log("Other", "Default", "said by a client");
  const std::uint64_t ticket = ask(client, "Messages", 0);
  EXPECT_EQ(archiveOf(client, ticket), "");
  ASSERT_TRUE(eventually([&] { return output().find("Other.log: cannot be written") != std::string::npos; }));
  EXPECT_THAT(output(), HasSubstr("Refused a dump of \"Messages\""));
  EXPECT_EQ(listTree(elsewhere), "");
  std::filesystem::remove(sandbox.logRoot() + "/Other");
  ASSERT_TRUE(
      eventually([&] { return sandbox.wholeLogSet("Other").find("said by a client") != std::string::npos; }));
  EXPECT_EQ(agent->terminate(), 0);
}

}  // namespace
}  // namespace zal
