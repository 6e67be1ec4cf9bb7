#include "platform/linux/baseband/hand_off_marker.h"

#include <gtest/gtest.h>
#include <sys/file.h>

#include <fcntl.h>

#include <filesystem>
#include <optional>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

class HandOffMarkerTest : public ::testing::Test {
 protected:
  [[nodiscard]] bool isThere() const { return std::filesystem::exists(path); }
  std::optional<HandOffMarker> take() {
    auto taken = HandOffMarker::take(path);
    if (const auto* why = std::get_if<std::error_code>(&taken)) {
      error = *why;
      return std::nullopt;
    }
    return std::get<HandOffMarker>(std::move(taken));
  }

  TemporaryDirectory directory;
  const std::string path = directory / "marker";
  std::error_code error;
};

TEST_F(HandOffMarkerTest, IsThereOncePlacedAndPlacingItAgainIsNoError) {
  EXPECT_FALSE(HandOffMarker::place(path));
  EXPECT_FALSE(HandOffMarker::place(path));
  EXPECT_TRUE(isThere());
}

TEST_F(HandOffMarkerTest, IsMadeByTakingItAndGoesWithItsHolder) {
  {
    const auto marker = take();
    EXPECT_TRUE(isThere());
  }
  EXPECT_FALSE(isThere());
}

TEST_F(HandOffMarkerTest, OneThatAKilledHolderLeftIsTakenOver) {
  writeFile(path, "");
  EXPECT_TRUE(take());
  EXPECT_FALSE(isThere());
}

TEST_F(HandOffMarkerTest, CannotBeTakenTwice) {
  const auto marker = take();
  EXPECT_FALSE(take());
  EXPECT_EQ(error, std::errc::device_or_resource_busy);
  EXPECT_TRUE(isThere());
}

TEST_F(HandOffMarkerTest, IsRemovedFromOutsideOnlyWhenNobodyHoldsIt) {
  {
    const auto marker = take();
    HandOffMarker::removeUnlessHeld(path);
    EXPECT_TRUE(isThere());
  }
  ASSERT_FALSE(HandOffMarker::place(path));
  HandOffMarker::removeUnlessHeld(path);
  EXPECT_FALSE(isThere());
  HandOffMarker::removeUnlessHeld(path);
}

TEST_F(HandOffMarkerTest, LinkInItsPlaceIsNotFollowed) {
  std::filesystem::create_symlink(directory / "elsewhere", path);
  EXPECT_EQ(HandOffMarker::place(path), std::errc::too_many_symbolic_link_levels);
  EXPECT_FALSE(take());
  EXPECT_FALSE(std::filesystem::exists(directory / "elsewhere"));
}

TEST_F(HandOffMarkerTest, MissingDirectoryIsTold) {
  EXPECT_EQ(HandOffMarker::place(directory / "none/marker"), std::errc::no_such_file_or_directory);
}

}  // namespace
}  // namespace zal::testing
