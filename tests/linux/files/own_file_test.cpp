#include "platform/linux/files/own_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <string>

#include "platform/linux/files/posix_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

constexpr uid_t kNobody = 65534;

/// Names in a directory that everybody writes to.
class OwnFileTest : public ::testing::Test {
 protected:
  OwnFileTest() {
    writeFile(victim, "untouched");
    fs::create_directory(directory / "shared");
    ::chmod(directory.path().c_str(), 0755);
    ::chmod((directory / "shared").c_str(), 01777);
  }
  void expectOwnFileOf(const std::string& content) const {
    const Descriptor file = openOwnFile(name, 0640);
    ASSERT_TRUE(file.isOpen()) << errno;
    ASSERT_EQ(::write(file.get(), "mine", 4), 4);
    EXPECT_EQ(readFile(name), content);
    struct stat status {};
    ASSERT_EQ(::lstat(name.c_str(), &status), 0);
    EXPECT_TRUE(S_ISREG(status.st_mode));
    EXPECT_EQ(status.st_uid, ::geteuid());
    EXPECT_EQ(readFile(victim), "untouched");
  }
  TemporaryDirectory directory;
  const std::string victim = directory / "victim";
  const std::string name = directory / "shared/name";
};

TEST_F(OwnFileTest, AFreeNameGetsANewFile) { expectOwnFileOf("mine"); }

TEST_F(OwnFileTest, AnOwnFileStaysAndIsWrittenFromItsBeginning) {
  writeFile(name, "before");
  expectOwnFileOf("minere");
}

TEST_F(OwnFileTest, ALinkLosesTheNameAndWhatItLeadsToStaysAsItIs) {
  fs::create_symlink(victim, name);
  expectOwnFileOf("mine");
}

TEST_F(OwnFileTest, ADanglingLinkMakesNothingElsewhere) {
  fs::create_symlink(directory / "elsewhere", name);
  expectOwnFileOf("mine");
  EXPECT_FALSE(fs::exists(directory / "elsewhere"));
}

TEST_F(OwnFileTest, AFileWithASecondNameLosesThisOne) {
  fs::create_hard_link(victim, name);
  expectOwnFileOf("mine");
}

TEST_F(OwnFileTest, APipeThatNobodyReadsHoldsNobodyUp) {
  ASSERT_EQ(::mkfifo(name.c_str(), 0666), 0);
  expectOwnFileOf("mine");
}

TEST_F(OwnFileTest, AnotherUsersFileGoesWhereItMayBeRemoved) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can make another user's file";
  writeFile(name, "planted");
  ASSERT_EQ(::chown(name.c_str(), kNobody, kNobody), 0);
  expectOwnFileOf("mine");
}

TEST_F(OwnFileTest, AnotherUsersFileThatMayNotBeRemovedIsAnErrorAndIsNotWritten) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become another user";
  writeFile(name, "planted");
  ::chmod(name.c_str(), 0666);
  const pid_t child = ::fork();
  if (child == 0) {
    if (::setgid(kNobody) != 0 || ::setuid(kNobody) != 0) ::_exit(9);
    const bool opened = openOwnFile(name, 0640).isOpen();
    ::_exit(opened ? 1 : errno == EPERM ? 0 : 2);
  }
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(readFile(name), "planted");
}

TEST_F(OwnFileTest, AnOutputIsPreparedUnlessADirectoryStandsThere) {
  PosixFilePlacement files{directory / "home", directory / "temporary"};
  fs::create_symlink(victim, name);
  EXPECT_FALSE(files.prepareOutput(name));
  EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(name)));
  EXPECT_FALSE(files.prepareOutput(directory / "missing/name"));
  fs::create_directories(directory / "shared/taken/below");
  EXPECT_TRUE(files.prepareOutput(directory / "shared/taken"));
  EXPECT_EQ(readFile(victim), "untouched");
}

}  // namespace
}  // namespace zal::testing
