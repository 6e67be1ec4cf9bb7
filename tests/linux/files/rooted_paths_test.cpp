#include "platform/linux/files/rooted_paths.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

class RootedPathsTest : public ::testing::Test {
 protected:
  RootedPathsTest() {
    fs::create_directories(directory / "real/Vistel");
    fs::create_directories(directory / "elsewhere/below");
    fs::create_directory_symlink("real", directory / "root");
    fs::create_directory_symlink("../elsewhere", directory / "real/planted");
  }
  /// Where the name would come to lie, below the test's directory, or why it would not.
  std::string placeOf(const std::string& path) const {
    const RootedPlace place = paths.placeOf(path);
    if (place.error) return place.error.message();
    const std::string parent = fs::read_symlink("/proc/self/fd/" + std::to_string(place.directory.get()));
    return parent.starts_with(directory.path())
               ? (parent + "/" + place.name).substr(directory.path().size() + 1)
               : parent + "/" + place.name;
  }
  TemporaryDirectory directory;
  const RootedPaths paths{{directory / "root/", directory / "other", "", "~/Logs"}, directory / "home"};
  const std::string refused = std::make_error_code(std::errc::too_many_symbolic_link_levels).message();
  const std::string leadsOut = std::make_error_code(std::errc::cross_device_link).message();
};

TEST_F(RootedPathsTest, ARootMayBeReachedThroughALinkByEitherOfItsNames) {
  EXPECT_EQ(placeOf(directory / "root/file"), "real/file");
  EXPECT_EQ(placeOf(directory / "root/Vistel/file"), "real/Vistel/file");
  EXPECT_EQ(placeOf(directory / "real/Vistel/directory/"), "real/Vistel/directory");
}

TEST_F(RootedPathsTest, BelowARootNoLinkIsFollowed) {
  EXPECT_EQ(placeOf(directory / "root/planted/file"), refused);
  EXPECT_EQ(placeOf(directory / "root/planted/below/file"), refused);
  EXPECT_EQ(placeOf(directory / "real/planted/file"), refused);
  EXPECT_EQ(placeOf(directory / "root/planted"), "real/planted") << "the link's own name is nobody's way";
}

TEST_F(RootedPathsTest, NothingLeadsOutOfARoot) {
  EXPECT_EQ(placeOf(directory / "root/../elsewhere/file"), leadsOut);
  EXPECT_EQ(placeOf(directory / "root/Vistel/.."), leadsOut);
}

TEST_F(RootedPathsTest, ElsewhereAPathIsTakenAsItIs) {
  fs::create_directory_symlink("elsewhere", directory / "rooted");
  EXPECT_EQ(placeOf(directory / "rooted/file"), "elsewhere/file");
  EXPECT_EQ(placeOf("/file"), "//file");
}

TEST_F(RootedPathsTest, TheInnermostRootCounts) {
  const RootedPaths nested({directory / "real", directory / "real/planted"}, "");
  EXPECT_FALSE(nested.placeOf(directory / "real/planted/file").error);
}

TEST_F(RootedPathsTest, AMissingRootIsMadeWithWhatIsBelow) {
  EXPECT_FALSE(paths.makeDirectories(directory / "home/Logs/a/b"));
  EXPECT_FALSE(paths.makeDirectories(directory / "other"));
  EXPECT_TRUE(fs::is_directory(directory / "home/Logs/a/b"));
  EXPECT_EQ(fs::status(directory / "other").permissions(), fs::perms::all);
}

TEST_F(RootedPathsTest, NoDirectoryIsMadeThroughALink) {
  EXPECT_EQ(paths.makeDirectories(directory / "root/planted/new"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(paths.makeDirectories(directory / "real/planted/new"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(listTree(directory / "elsewhere"), "below/\n");
}

}  // namespace
}  // namespace zal::testing
