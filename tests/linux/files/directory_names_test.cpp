#include "platform/linux/files/directory_names.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Names = std::vector<std::string>;

TEST(DirectoryNamesTest, EverythingIsNamedInTheOrderOfBytesHiddenOnesAndLinksToNothingToo) {
  const TemporaryDirectory directory;
  for (const char* name : {"b", "B", "a/below", ".hidden"}) writeFile(directory / name, "");
  std::filesystem::create_symlink("nowhere", directory / "link");
  EXPECT_EQ(namesIn(directory.path()), (Names{".hidden", "B", "a", "b", "link"}));
}

TEST(DirectoryNamesTest, WhatCannotBeReadIsEmptyAndSaysWhy) {
  const TemporaryDirectory directory;
  writeFile(directory / "file", "");
  std::error_code error;
  EXPECT_EQ(namesIn(directory / "missing", error), Names{});
  EXPECT_EQ(error, std::errc::no_such_file_or_directory);
  EXPECT_EQ(namesIn(directory / "file", error), Names{});
  EXPECT_EQ(error, std::errc::not_a_directory);
  EXPECT_EQ(namesIn(directory / "missing"), Names{});
}

}  // namespace
}  // namespace zal::testing
