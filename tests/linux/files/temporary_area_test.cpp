#include "platform/linux/files/temporary_area.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

class TemporaryAreaTest : public ::testing::Test {
 protected:
  TemporaryDirectory directory;
  const std::string base = directory / "area";
};

TEST_F(TemporaryAreaTest, ItIsTheSameAsLongAsItsProcessLivesAndMadeAgainWhenItWasRemoved) {
  TemporaryArea area(base);
  EXPECT_EQ(area.path(), base);
  writeFile(base + "/file", "");
  EXPECT_EQ(area.path(), base);
  std::filesystem::remove_all(base);
  EXPECT_EQ(area.path(), base);
  EXPECT_TRUE(std::filesystem::is_directory(base));
}

TEST_F(TemporaryAreaTest, WhereAnotherHoldsItThereIsOneBesideIt) {
  TemporaryArea first(base), second(base);
  ASSERT_EQ(first.path(), base);
  const std::string beside = second.path();
  EXPECT_TRUE(beside.starts_with(base + "-")) << beside;
  EXPECT_EQ(second.path(), beside);
  EXPECT_EQ(temporaryAreaNames(base),
            (std::vector<std::string>{"area", std::filesystem::path(beside).filename()}));
}

TEST_F(TemporaryAreaTest, WhereAFormerProcessLeftSomethingThereIsOneBesideIt) {
  writeFile(base + "/left", "");
  TemporaryArea area(base);
  EXPECT_TRUE(area.path().starts_with(base + "-"));
}

}  // namespace
}  // namespace zal::testing
