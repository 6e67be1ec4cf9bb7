#include "platform/linux/files/file_copy.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <filesystem>
#include <string>
#include <vector>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/file_content.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

class FileCopyTest : public ::testing::Test {
 protected:
  CopyOutcome copy(const std::string& source, const std::string& target, bool sync = false) {
    return copyTree(directory / source, directory / target, {sync});
  }
  TemporaryDirectory directory;
};

TEST_F(FileCopyTest, AFileKeepsContentModeAndTime) {
  const std::string content(1'000'003, 'x');
  writeFile(directory / "a", content);
  ::chmod((directory / "a").c_str(), 0640);
  setTime(directory / "a", 1500000000, 123456789);
  const CopyOutcome outcome = copy("a", "b", true);
  EXPECT_FALSE(outcome.error) << outcome.error.message();
  EXPECT_EQ(readFile(directory / "b"), content);
  EXPECT_EQ(modeAndTime(directory / "b"), "640 1500000000123456789");
}

TEST_F(FileCopyTest, ACopyIsWholeFromTheMomentThatItsNameIsThere) {
  const Descriptor nameless(
      ::open(directory.path().c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, S_IRUSR | S_IWUSR));
  if (!nameless.isOpen()) GTEST_SKIP() << "the file system has no files without a name";
  writeFile(directory / "from/a/b", std::string(1'000'003, 'x'));
  writeFile(directory / "to/there", "");
  const Descriptor watch(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  ::inotify_add_watch(watch.get(), (directory / "to").c_str(), IN_CREATE | IN_MODIFY);
  EXPECT_FALSE(copy("from/a/b", "to/b").error);
  alignas(inotify_event) char events[4096];
  const ssize_t length = ::read(watch.get(), events, sizeof events);
  std::vector<std::uint32_t> seen;
  for (ssize_t at = 0; at < length;) {
    const auto& event = *reinterpret_cast<const inotify_event*>(events + at);
    if (std::string(event.name) == "b") seen.push_back(event.mask);
    at += static_cast<ssize_t>(sizeof event + event.len);
  }
  EXPECT_EQ(seen, std::vector<std::uint32_t>{IN_CREATE});
  EXPECT_EQ(readFile(directory / "to/b").size(), 1'000'003U);
}

TEST_F(FileCopyTest, ACopyDoesNotLendItsOwnersRights) {
  writeFile(directory / "a", "x");
  ::chmod((directory / "a").c_str(), 06755);
  setTime(directory / "a", 1, 0);
  EXPECT_FALSE(copy("a", "b").error);
  EXPECT_EQ(modeAndTime(directory / "b"), "755 1000000000");
}

TEST_F(FileCopyTest, ADirectoryKeepsEverythingBelowItAndItsOwnModeAndTime) {
  writeFile(directory / "a/.hidden", "h");
  writeFile(directory / "a/deep/er/file", "content");
  fs::create_directory(directory / "a/empty");
  fs::create_symlink("deep/er", directory / "a/link");
  fs::create_symlink("/nonexistent/target", directory / "a/dangling");
  setTime(directory / "a/link", 1400000000, 5);
  setTime(directory / "a/deep/er", 1400000001, 0);
  ::chmod((directory / "a/deep").c_str(), 0555);
  setTime(directory / "a/deep", 1400000002, 0);
  setTime(directory / "a", 1400000003, 0);
  const CopyOutcome outcome = copy("a", "b", true);
  EXPECT_FALSE(outcome.error) << outcome.error.message();
  EXPECT_EQ(outcome.skipped, 0U);
  EXPECT_EQ(listTree(directory / "b"), listTree(directory / "a"));
  EXPECT_EQ(readFile(directory / "b/deep/er/file"), "content");
  EXPECT_EQ(fs::read_symlink(directory / "b/link"), "deep/er");
  EXPECT_EQ(fs::read_symlink(directory / "b/dangling"), "/nonexistent/target");
  for (const char* name : {"", "/link", "/deep/er", "/deep", "/deep/er/file"}) {
    EXPECT_EQ(modeAndTime(directory / "b" + name), modeAndTime(directory / "a" + name)) << name;
  }
  ::chmod((directory / "a/deep").c_str(), 0755);
  ::chmod((directory / "b/deep").c_str(), 0755);
}

TEST_F(FileCopyTest, PipesSocketsAndDevicesInADirectoryAreSkippedAndNotOpened) {
  writeFile(directory / "a/file", "content");
  makeNamedPipe(directory / "a/pipe");
  const Descriptor listener(::socket(AF_UNIX, SOCK_STREAM, 0));
  sockaddr_un address{AF_UNIX, {}};
  (directory / "a/socket").copy(address.sun_path, sizeof address.sun_path - 1);
  ASSERT_EQ(::bind(listener.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  const CopyOutcome outcome = copy("a", "b");
  EXPECT_FALSE(outcome.error) << outcome.error.message();
  EXPECT_EQ(outcome.skipped, 2U);
  EXPECT_EQ(listTree(directory / "b"), "file\n");
}

TEST_F(FileCopyTest, APipeAskedForByItselfIsAnErrorAndNotOpened) {
  makeNamedPipe(directory / "pipe");
  EXPECT_EQ(copy("pipe", "b").error, std::errc::operation_not_supported);
  EXPECT_EQ(listTree(directory.path()), "pipe\n");
}

TEST_F(FileCopyTest, NothingThatStandsAtTheTargetIsTouchedOrFollowed) {
  writeFile(directory / "a", "new");
  writeFile(directory / "dir/file", "new");
  writeFile(directory / "file", "old");
  writeFile(directory / "full/old", "old");
  fs::create_symlink("elsewhere", directory / "dangling");
  fs::create_directory_symlink("full", directory / "linked");
  for (const char* target : {"file", "full", "dangling", "linked"}) {
    EXPECT_EQ(copy("a", target).error, std::errc::file_exists) << target;
    EXPECT_EQ(copy("dir", target).error, std::errc::file_exists) << target;
  }
  EXPECT_EQ(readFile(directory / "file"), "old");
  EXPECT_EQ(listTree(directory / "full"), "old\n");
  EXPECT_FALSE(fs::exists(directory / "elsewhere"));
}

TEST_F(FileCopyTest, AMissingSourceIsAnErrorAndMakesNothing) {
  EXPECT_EQ(copy("missing", "b").error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(listTree(directory.path()), "");
}

TEST_F(FileCopyTest, ATargetInsideTheSourceDoesNotContainItself) {
  writeFile(directory / "a/file", "content");
  EXPECT_FALSE(copy("a", "a/copy").error);
  EXPECT_EQ(listTree(directory / "a/copy"), "file\n");
}

TEST_F(FileCopyTest, AGeneratedFileThatClaimsToBeEmptyIsCopiedWhole) {
  ASSERT_EQ(fs::file_size("/proc/self/limits"), 0U);
  EXPECT_FALSE(copyTree("/proc/self/limits", directory / "limits", {}).error);
  EXPECT_EQ(readFile(directory / "limits"), readFile("/proc/self/limits"));
  EXPECT_NE(readFile(directory / "limits"), "");
}

TEST_F(FileCopyTest, OneFileThatFailsDoesNotStopTheOthers) {
  const TinyFileSystem tiny(directory / "tiny");
  if (!tiny.missing.empty()) GTEST_SKIP() << tiny.missing;
  writeFile(directory / "a/1-small", "small");
  writeFile(directory / "a/2-large", std::string(200'000, 'x'));
  writeFile(directory / "a/3-small", "small");
  EXPECT_EQ(copy("a", "tiny/b").error, std::errc::no_space_on_device);
  EXPECT_EQ(listTree(directory / "tiny/b"), "1-small\n3-small\n");
}

TEST_F(FileCopyTest, AFullDeviceIsAnError) {
  writeFile(directory / "a", "content");
  const Descriptor source(::open((directory / "a").c_str(), O_RDONLY)), full(::open("/dev/full", O_WRONLY));
  ASSERT_TRUE(full.isOpen());
  EXPECT_EQ(copyFileContent(source.get(), full.get()), std::errc::no_space_on_device);
}

TEST_F(FileCopyTest, AcrossFileSystemsTheContentIsTheSame) {
  const OtherFileSystem other;
  if (other.path.empty()) GTEST_SKIP() << other.missing;
  std::string content;
  for (int i = 0; i < 100'000; ++i) content += std::to_string(i);
  writeFile(directory / "a", content);
  EXPECT_FALSE(copyTree(directory / "a", other / "b", {}).error);
  EXPECT_EQ(readFile(other / "b"), content);
}

}  // namespace
}  // namespace zal::testing
