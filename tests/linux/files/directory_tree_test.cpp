#include "platform/linux/files/directory_tree.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>

#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

class DirectoryTreeTest : public ::testing::Test {
 protected:
  [[nodiscard]] std::uint64_t blocks(const std::string& name) const {
    struct stat status {};
    ::lstat((directory / name).c_str(), &status);
    return static_cast<std::uint64_t>(status.st_blocks) * 512;
  }
  [[nodiscard]] std::uint64_t bytes(const std::string& name) const { return diskBytesAt(handle.get(), name); }
  std::error_code remove(const std::string& name) { return removeTreeAt(handle.get(), name); }

  TemporaryDirectory directory;
  const Descriptor handle{::open(directory.path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)};
};

TEST_F(DirectoryTreeTest, ATreeTakesWhatItsFilesAndDirectoriesTake) {
  writeFile(directory / "tree/below/large", std::string(100'000, 'x'));
  writeFile(directory / "tree/small", "x");
  EXPECT_EQ(bytes("tree"),
            blocks("tree") + blocks("tree/below") + blocks("tree/below/large") + blocks("tree/small"));
  EXPECT_GE(bytes("tree"), 100'000U);
  EXPECT_EQ(bytes("missing"), 0U);
}

TEST_F(DirectoryTreeTest, AFileWithTwoNamesCountsHalfForEachAndALinkIsNotFollowed) {
  writeFile(directory / "log", std::string(100'000, 'x'));
  const std::uint64_t whole = blocks("log");
  fs::create_directory(directory / "tree");
  fs::create_hard_link(directory / "log", directory / "tree/log");
  fs::create_symlink(directory / "log", directory / "tree/link");
  EXPECT_EQ(bytes("tree"), blocks("tree") + whole / 2 + blocks("tree/link"));
}

TEST_F(DirectoryTreeTest, AHoleTakesNothing) {
  writeFile(directory / "sparse", "");
  fs::resize_file(directory / "sparse", 1ULL << 30U);
  EXPECT_LT(bytes("sparse"), 1'000'000U);
}

TEST_F(DirectoryTreeTest, RemovingTakesAllBelowAndNothingThatLinksLeadTo) {
  writeFile(directory / "elsewhere/file", "");
  writeFile(directory / "tree/a/b/c", "");
  makeNamedPipe(directory / "tree/pipe");
  fs::create_directory_symlink(directory / "elsewhere", directory / "tree/a/link");
  fs::create_directory_symlink(directory / "elsewhere", directory / "link");
  EXPECT_EQ(remove("tree"), std::error_code());
  EXPECT_EQ(remove("link"), std::error_code());
  EXPECT_EQ(remove("missing"), std::error_code());
  EXPECT_EQ(listTree(directory.path()), "elsewhere/\nelsewhere/file\n");
}

TEST_F(DirectoryTreeTest, TreesDeeperThanAHundredLevelsStayFromThereOn) {
  std::string deep = directory / "tree";
  for (int i = 0; i < 105; ++i) deep += "/d";
  fs::create_directories(deep);
  writeFile(directory / "tree/file", "");
  EXPECT_EQ(remove("tree"), std::errc::filename_too_long);
  EXPECT_FALSE(fs::exists(directory / "tree/file"));
  EXPECT_TRUE(fs::exists(deep));
}

}  // namespace
}  // namespace zal::testing
