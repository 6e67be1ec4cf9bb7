#include "agent/verbose_log_purge.h"

#include <gtest/gtest.h>

#include <array>

#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using testing::listTree;
using testing::writeFile;

class VerboseLogPurgeTest : public ::testing::Test {
 protected:
  void purge() {
    constexpr std::array<std::string_view, 2> types = {"Nexa", "Messages"};
    purgeVerboseLogs(files, root.path(), types);
  }
  testing::TemporaryDirectory root;
  testing::PlainFilePlacement files{root / "home"};
};

TEST_F(VerboseLogPurgeTest, DeletesVisibleEntriesWithTheMarkerAndKeepsTheRest) {
  writeFile(root / "Messages/Messages-Verbose-1.log", "old");
  writeFile(root / "Messages/Messages-verbose-1.log", "other case");
  writeFile(root / "Messages/Messages-Verbose.log", "no second dash");
  writeFile(root / "Messages/.hidden-Verbose-1.log", "hidden");
  writeFile(root / "Messages/a-Verbose-directory/inner.log", "goes with its directory");
  writeFile(root / "Messages/deeper/x-Verbose-1.log", "one level is enough");
  writeFile(root / "Other/Other-Verbose-1.log", "another type");
  purge();
  EXPECT_EQ(listTree(root.path()),
            "Messages/\n"
            "Messages/.hidden-Verbose-1.log\n"
            "Messages/Messages-Verbose.log\n"
            "Messages/Messages-verbose-1.log\n"
            "Messages/deeper/\n"
            "Messages/deeper/x-Verbose-1.log\n"
            "Other/\n"
            "Other/Other-Verbose-1.log\n");
}

TEST_F(VerboseLogPurgeTest, PassesOverADirectoryThatIsMissingOrIsAFile) {
  writeFile(root / "Nexa", "a file in the place of the directory");
  writeFile(root / "Messages/M-Verbose-1.log", "old");
  purge();
  EXPECT_EQ(listTree(root.path()), "Messages/\nNexa\n");
}

TEST_F(VerboseLogPurgeTest, TheMarkerCountsAnywhereInTheFullPath) {
  constexpr std::array<std::string_view, 1> types = {"Nexa"};
  writeFile(root / "logs-Verbose-set/Nexa/plain.log", "below a marked directory");
  purgeVerboseLogs(files, root / "logs-Verbose-set", types);
  EXPECT_EQ(listTree(root.path()), "logs-Verbose-set/\nlogs-Verbose-set/Nexa/\n");
}

TEST_F(VerboseLogPurgeTest, ALinkGoesAndItsTargetStays) {
  writeFile(root / "kept/file", "kept");
  std::filesystem::create_directories(root / "Nexa");
  std::filesystem::create_symlink(root / "kept", root / "Nexa/N-Verbose-link");
  purge();
  EXPECT_EQ(listTree(root.path()), "Nexa/\nkept/\nkept/file\n");
}

}  // namespace
}  // namespace zal
