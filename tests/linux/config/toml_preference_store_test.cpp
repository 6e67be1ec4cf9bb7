#include "platform/linux/config/toml_preference_store.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>

#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::readFile;
using testing::TemporaryDirectory;
using testing::writeFile;

constexpr std::string_view kDomain = "com.vendel.logging";

class TomlPreferenceStoreTest : public ::testing::Test {
 protected:
  void write(const std::string& text) { writeFile(file, text); }
  std::optional<bool> freshly(std::string_view key) {
    store.synchronize(kDomain);
    return store.boolean(kDomain, key);
  }
  std::optional<std::string> set(std::string_view key, bool value) {
    return TomlPreferenceStore::setBoolean(directory.path(), kDomain, key, value);
  }

  TemporaryDirectory directory;
  const std::string file = directory / "com.vendel.logging.toml";
  testing::RecordingAgentLog log;
  TomlPreferenceStore store{directory.path(), log};
};

TEST_F(TomlPreferenceStoreTest, AMissingFileHasNoKeysAndIsNoReasonToWarn) {
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(TomlPreferenceStoreTest, OnlyBooleansAreSwitches) {
  write("CallLogging = true\nConsoleOutput = false\nNumber = 1\nWord = \"true\"\n[Table]\nInner = true\n");
  EXPECT_EQ(freshly("CallLogging"), true);
  EXPECT_EQ(freshly("ConsoleOutput"), false);
  for (const char* key : {"Number", "Word", "Table", "Inner", "Missing"}) {
    EXPECT_EQ(store.boolean(kDomain, key), std::nullopt) << key;
  }
}

TEST_F(TomlPreferenceStoreTest, TheFirstQuestionReadsTheFile) {
  write("CallLogging = true\n");
  EXPECT_EQ(store.boolean(kDomain, "CallLogging"), true);
}

TEST_F(TomlPreferenceStoreTest, ChangesCountFromTheNextSynchronize) {
  write("CallLogging = true\n");
  EXPECT_EQ(freshly("CallLogging"), true);
  write("CallLogging = false\n");
  EXPECT_EQ(store.boolean(kDomain, "CallLogging"), true);
  EXPECT_EQ(freshly("CallLogging"), false);
  std::filesystem::remove(file);
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
}

TEST_F(TomlPreferenceStoreTest, AReplacedFileOfTheSameSizeAndTimeIsNoticed) {
  write("CallLogging = true \n");
  EXPECT_EQ(freshly("CallLogging"), true);
  writeFile(directory / "new", "CallLogging = false\n");
  std::filesystem::last_write_time(directory / "new", std::filesystem::last_write_time(file));
  std::filesystem::rename(directory / "new", file);
  EXPECT_EQ(freshly("CallLogging"), false);
}

TEST_F(TomlPreferenceStoreTest, ABrokenFileHasNoKeysAndWarnsOncePerChange) {
  write("CallLogging = true\nConsoleOutput = \n");
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: " + file + ":2: ")) << log.lines[0];
  write("\nCallLogging = true\nConsoleOutput = \n");
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  ASSERT_EQ(log.lines.size(), 2U);
  EXPECT_TRUE(log.lines[1].starts_with("warning: " + file + ":3: ")) << log.lines[1];
}

TEST_F(TomlPreferenceStoreTest, WhatIsNoFileWarnsOnce) {
  std::filesystem::create_directory(file);
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  EXPECT_EQ(freshly("CallLogging"), std::nullopt);
  EXPECT_THAT(log.lines, ElementsAre("warning: " + file + ":1: cannot be read: Is a directory"));
}

TEST_F(TomlPreferenceStoreTest, WhatCannotBeReadForAMomentStaysAsItWasAndIsReadTheNextTime) {
  write("CallLogging = true\n");
  EXPECT_EQ(freshly("CallLogging"), true);
  write("CallLogging = true\nConsoleOutput = true\n");
  rlimit before{};
  ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &before), 0);
  const rlimit none{0, before.rlim_max};
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &none), 0);
  const auto meanwhile = freshly("CallLogging");
  EXPECT_EQ(freshly("ConsoleOutput"), std::nullopt);
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &before), 0);
  EXPECT_EQ(meanwhile, true);
  EXPECT_THAT(log.lines, ElementsAre("warning: " + file + ":1: cannot be read: Too many open files"));
  EXPECT_EQ(freshly("ConsoleOutput"), true);
}

TEST_F(TomlPreferenceStoreTest, SettingMakesFileAndDirectory) {
  const std::string deep = directory / "new/place";
  EXPECT_EQ(TomlPreferenceStore::setBoolean(deep, kDomain, "CallLogging", true), std::nullopt);
  EXPECT_EQ(readFile(deep + "/com.vendel.logging.toml"), "CallLogging = true\n");
  EXPECT_EQ(testing::listTree(deep), "com.vendel.logging.toml\n");
}

TEST_F(TomlPreferenceStoreTest, SettingKeepsOtherKeysCommentsAndTheFilesMode) {
  write("# ours\nCallLogging = false  # märz\nOther = 3");
  std::filesystem::permissions(file, std::filesystem::perms(0600));
  EXPECT_EQ(set("CallLogging", true), std::nullopt);
  EXPECT_EQ(set("ConsoleOutput", false), std::nullopt);
  EXPECT_EQ(readFile(file), "# ours\nCallLogging = true  # märz\nOther = 3\nConsoleOutput = false\n");
  EXPECT_EQ(std::filesystem::status(file).permissions(), std::filesystem::perms(0600));
}

TEST_F(TomlPreferenceStoreTest, SettingReplacesAValueOfAnotherType) {
  write("\"é\" = 1\nCallLogging = \"äöü yes\" # why\n");
  EXPECT_EQ(set("CallLogging", true), std::nullopt);
  EXPECT_EQ(readFile(file), "\"é\" = 1\nCallLogging = true # why\n");
}

TEST_F(TomlPreferenceStoreTest, ANewKeyStaysOutOfSections) {
  write("[section]\nx = 1\n");
  EXPECT_EQ(set("CallLogging", true), std::nullopt);
  EXPECT_EQ(readFile(file), "CallLogging = true\n[section]\nx = 1\n");
}

TEST_F(TomlPreferenceStoreTest, SettingLeavesABrokenFileAlone) {
  write("a = 1\nb =\n");
  const auto reason = set("CallLogging", true);
  ASSERT_TRUE(reason.has_value());
  EXPECT_TRUE(reason->starts_with(file + ":2: ")) << *reason;
  EXPECT_EQ(readFile(file), "a = 1\nb =\n");
}

TEST_F(TomlPreferenceStoreTest, SettingRefusesWhatItCannotReplace) {
  write("[CallLogging]\nx = 1\n");
  EXPECT_EQ(set("CallLogging", true),
            file + ":1: the value of CallLogging cannot be replaced; edit the file by hand");
  EXPECT_EQ(set("a\nb", true), file + ":1: a key is made of letters, digits, '_' and '-'");
  EXPECT_EQ(readFile(file), "[CallLogging]\nx = 1\n");
}

TEST_F(TomlPreferenceStoreTest, SettingFollowsASymbolicLink) {
  writeFile(directory / "real.toml", "");
  std::filesystem::create_symlink("real.toml", file);
  EXPECT_EQ(set("CallLogging", true), std::nullopt);
  EXPECT_EQ(readFile(directory / "real.toml"), "CallLogging = true\n");
  EXPECT_TRUE(std::filesystem::is_symlink(file));
}

}  // namespace
}  // namespace zal
