#include <gtest/gtest.h>

#include "platform/linux/archive/entry_names.h"
#include "platform/linux/archive/kept_aside.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Names = std::vector<std::string>;

TEST(EntryNamesTest, NamesInUtf8StayAsTheyAre) {
  EXPECT_EQ(entryNames({"a", "ü", "会"}), (Names{"a", "ü", "会"}));
  EXPECT_EQ(entryNames({}), Names{});
}

TEST(EntryNamesTest, WhatBecomesOneNameIsKeptApart) {
  EXPECT_EQ(entryNames({"\xFE", "\xFF", "a", "\xEF\xBF\xBD-2"}),
            (Names{"\xEF\xBF\xBD", "\xEF\xBF\xBD-3", "a", "\xEF\xBF\xBD-2"}));
  EXPECT_EQ(entryNames({"\xFE", "\xEF\xBF\xBD"}), (Names{"\xEF\xBF\xBD-2", "\xEF\xBF\xBD"}));
}

class KeptAsideTest : public ::testing::Test {
 protected:
  const TemporaryDirectory directory;
  std::error_code error;
};

TEST_F(KeptAsideTest, TakesTheFirstFreeName) {
  for (const char* expected : {"Log (not archived)", "Log (not archived)-2", "Log (not archived)-3"}) {
    writeFile(directory / "Log/file", expected);
    EXPECT_EQ(keepAside(directory / "Log", error), directory / expected);
    EXPECT_FALSE(error);
    EXPECT_EQ(readFile(directory / std::string(expected) + "/file"), expected);
  }
}

TEST_F(KeptAsideTest, ANameThatIsTooLongIsCutBetweenCharacters) {
  std::string name;
  while (name.size() < 254) name += "ü";
  std::filesystem::create_directories(directory / name);
  const std::string aside = keepAside(directory / name, error);
  EXPECT_FALSE(error);
  EXPECT_EQ(aside, directory / (name.substr(0, 240) + " (not archived)"));
  EXPECT_TRUE(std::filesystem::is_directory(aside));
}

TEST_F(KeptAsideTest, WhatIsNotThereCannotBeKept) {
  EXPECT_EQ(keepAside(directory / "nowhere", error), "");
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
}

}  // namespace
}  // namespace zal::testing
