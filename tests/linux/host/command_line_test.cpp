#include "platform/linux/host/command_line.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(CommandLineTest, WithoutArgumentsNothingIsAskedFor) {
  const CommandLine line = CommandLine::parse({});
  EXPECT_EQ(line.configFile, std::nullopt);
  EXPECT_EQ(line.socketPath, std::nullopt);
  EXPECT_FALSE(line.help);
  EXPECT_FALSE(line.version);
  EXPECT_EQ(line.trouble, std::nullopt);
}

TEST(CommandLineTest, TakesValuesAsTheNextWordOrBehindAnEqualsSign) {
  const CommandLine line = CommandLine::parse({"--config", "/a=b.toml", "--socket=/run/x=y"});
  EXPECT_EQ(line.configFile, "/a=b.toml");
  EXPECT_EQ(line.socketPath, "/run/x=y");
  EXPECT_EQ(line.trouble, std::nullopt);
}

TEST(CommandLineTest, TheLastValueCounts) {
  EXPECT_EQ(CommandLine::parse({"--config", "/a", "--config=/b"}).configFile, "/b");
}

TEST(CommandLineTest, KnowsHelpAndVersion) {
  EXPECT_TRUE(CommandLine::parse({"--help"}).help);
  EXPECT_TRUE(CommandLine::parse({"-h"}).help);
  EXPECT_TRUE(CommandLine::parse({"--version"}).version);
}

TEST(CommandLineTest, SaysWhatItDoesNotUnderstand) {
  EXPECT_EQ(CommandLine::parse({"--foreground"}).trouble, "There is no option --foreground; try --help.");
  EXPECT_EQ(CommandLine::parse({"file"}).trouble, "There is no option file; try --help.");
  EXPECT_EQ(CommandLine::parse({"--config"}).trouble, "--config wants a path behind it.");
  EXPECT_EQ(CommandLine::parse({"--socket="}).trouble, "--socket wants a path behind it.");
}

}  // namespace
}  // namespace zal
