#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using testing::RawClient;

/// The logs on a file system of one mebibyte.
class FullDiskE2eTest : public testing::E2eFixture {
 protected:
  void SetUp() override {
    _disk = sandbox / "disk";
    std::filesystem::create_directories(_disk);
    if (::mount("tmpfs", _disk.c_str(), "tmpfs", 0, "size=1m") != 0) {
      const int error = errno;
      _disk.clear();
      GTEST_SKIP() << "a tmpfs cannot be mounted here: " << std::strerror(error);
    }
    sandbox.stateRoot = _disk;
  }
  void TearDown() override {
    E2eFixture::TearDown();
    if (!_disk.empty()) ::umount2(_disk.c_str(), MNT_DETACH);
  }
  void fill() {
    testing::writeFile(_disk + "/ballast", "");
    std::ofstream ballast(_disk + "/ballast", std::ios::binary);
    const std::string block(4096, 'x');
    while (ballast.write(block.data(), static_cast<std::streamsize>(block.size())).flush()) {
    }
  }
  void makeRoom() { std::filesystem::remove(_disk + "/ballast"); }

 private:
  std::string _disk;
};

TEST_F(FullDiskE2eTest, TheAgentLivesOnSaysSoAndWritesAgainWhenThereIsRoom) {
  start();
  RawClient client(sandbox.socketPath());
  client.sendLog("Disk", "before");
  ASSERT_TRUE(client.barrier());
  fill();
  const std::string longText(3000, 'y');
  for (int i = 0; i < 10; ++i) client.sendLog("Disk", longText);
  ASSERT_TRUE(client.barrier());
  client.beginSession("Vistel");
  for (const char* text : {"one", "two"}) client.sendCheckpoint("Vistel", text, 1714651388.0);
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(output(), HasSubstr("No space left on device"));
  EXPECT_THAT(output(), HasSubstr("/Disk/Disk.log"));
  makeRoom();
  client.sendLog("Disk", "after");
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(sandbox.wholeLogSet("Disk"), EndsWith("[test:e2e] after\n"));
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("End Session"));
}

}  // namespace
}  // namespace zal
