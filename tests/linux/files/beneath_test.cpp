#include "platform/linux/files/beneath.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cerrno>
#include <filesystem>
#include <string>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

/// Both ways down have to give the same answers.
class BeneathTest : public ::testing::TestWithParam<WayDown> {
 protected:
  BeneathTest() {
    fs::create_directories(directory / "root/a/b");
    fs::create_directories(directory / "elsewhere/b");
    writeFile(directory / "root/a/file", "");
    root = Descriptor(::open((directory / "root").c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  }
  /// What was opened, as its path below the test's directory, or why nothing was.
  std::string opened(const std::string& path) {
    const Descriptor found = openDirectoryBeneath(root.get(), path, GetParam());
    if (!found.isOpen()) return std::generic_category().message(errno);
    return fs::relative(fs::read_symlink("/proc/self/fd/" + std::to_string(found.get())), directory.path());
  }
  static std::string reason(int error) { return std::generic_category().message(error); }
  TemporaryDirectory directory;
  Descriptor root;
};

INSTANTIATE_TEST_SUITE_P(Ways, BeneathTest, ::testing::Values(WayDown::inOneCall, WayDown::inSteps),
                         [](const auto& way) {
                           return way.param == WayDown::inOneCall ? "InOneCall" : "InSteps";
                         });

TEST_P(BeneathTest, OpensDirectories) {
  EXPECT_EQ(opened("a/b"), "root/a/b");
  EXPECT_EQ(opened("a//./b/"), "root/a/b");
  EXPECT_EQ(opened(""), "root");
}

TEST_P(BeneathTest, SaysWhatIsMissingOrNoDirectory) {
  EXPECT_EQ(opened("a/c"), reason(ENOENT));
  EXPECT_EQ(opened("c/d"), reason(ENOENT));
  EXPECT_EQ(opened("a/file"), reason(ENOTDIR));
  EXPECT_EQ(opened("a/file/x"), reason(ENOTDIR));
  EXPECT_EQ(opened(std::string(300, 'x')), reason(ENAMETOOLONG));
}

TEST_P(BeneathTest, FollowsNoLinkWhereverItStandsOrLeads) {
  fs::create_directory_symlink(directory / "elsewhere", directory / "root/out");
  fs::create_directory_symlink("a", directory / "root/in");
  fs::create_directory_symlink("b", directory / "root/a/end");
  fs::create_symlink("nowhere", directory / "root/dangling");
  for (const std::string path : {"out", "out/b", "in", "in/b", "a/end", "a/end/", "dangling", "dangling/x"}) {
    EXPECT_EQ(opened(path), reason(ELOOP)) << path;
  }
}

TEST_P(BeneathTest, LeadsNeitherUpNorToTheTop) {
  for (const std::string path : {"..", "../elsewhere", "a/..", "a/../a", "a/b/../../../elsewhere", "/tmp"}) {
    EXPECT_EQ(opened(path), reason(EXDEV)) << path;
  }
  EXPECT_EQ(opened(std::string("a\0b", 3)), reason(EINVAL));
}

TEST_P(BeneathTest, ARootThatIsReachedThroughALinkIsAsGood) {
  fs::create_directory_symlink("root", directory / "link");
  root = Descriptor(::open((directory / "link").c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  EXPECT_EQ(opened("a/b"), "root/a/b");
}

class MakeDirectoriesBeneathTest : public BeneathTest {
 protected:
  std::error_code make(const std::string& path) { return makeDirectoriesBeneath(root.get(), path); }
  [[nodiscard]] unsigned modeOf(const std::string& path) const {
    struct stat status {};
    return ::stat((directory / path).c_str(), &status) == 0 ? status.st_mode & 07777U : 0;
  }
};

INSTANTIATE_TEST_SUITE_P(Ways, MakeDirectoriesBeneathTest, ::testing::Values(WayDown::inOneCall));

TEST_P(MakeDirectoriesBeneathTest, WhatIsMadeIsOpenToAllAndWhatWasThereKeepsItsMode) {
  ::chmod((directory / "root/a").c_str(), 0750);
  const mode_t before = ::umask(077);
  EXPECT_FALSE(make("a/new/newer"));
  EXPECT_FALSE(make("a/new/newer"));
  ::umask(before);
  EXPECT_EQ(modeOf("root/a"), 0750U);
  EXPECT_EQ(modeOf("root/a/new"), 0777U);
  EXPECT_EQ(modeOf("root/a/new/newer"), 0777U);
}

TEST_P(MakeDirectoriesBeneathTest, NothingIsMadeBehindALinkOrOutside) {
  fs::create_directory_symlink(directory / "elsewhere", directory / "root/out");
  fs::create_directory_symlink(directory / "elsewhere/new", directory / "root/dangling");
  EXPECT_EQ(make("out"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(make("out/new"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(make("dangling"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(make("../elsewhere/new"), std::errc::cross_device_link);
  EXPECT_EQ(make("a/file/new"), std::errc::not_a_directory);
  EXPECT_EQ(listTree(directory / "elsewhere"), "b/\n");
}

}  // namespace
}  // namespace zal::testing
