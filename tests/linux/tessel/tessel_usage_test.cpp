#include "tests/linux/tessel/tessel_fixture.h"

namespace zal::testing {
namespace {

class TesselUsageTest : public TesselFixture {};

TEST_F(TesselUsageTest, WrongUsageEndsWithTwoAndAMessage) {
  EXPECT_EQ(run({"-k", "Time", "ge", "now"}), 2);
  EXPECT_EQ(out, "");
  EXPECT_EQ(err, "tessel: \"now\" is no age such as -30s, -5m, -2h or -1d; see tessel --help\n");
}

TEST_F(TesselUsageTest, HelpNamesEveryOption) {
  EXPECT_EQ(run({"--help"}), 0);
  for (const char* option : {"-w", "-k Time ge", "--journal-directory", "--syslog", "--kmsg", "--help"}) {
    EXPECT_NE(out.find(option), std::string::npos) << option;
  }
}

TEST_F(TesselUsageTest, WithoutAnyLogItSaysWhatIsWrongWithEach) {
  EXPECT_EQ(
      run({"--journal-directory", directory / "j", "--syslog", directory / "s", "--kmsg", directory / "k"}),
      1);
  EXPECT_EQ(out, "");
  EXPECT_EQ(err, "tessel: no log can be read: the journal cannot be opened: No such file or directory; " +
                     directory / "s" + ": No such file or directory; " + directory / "k" +
                     ": No such file or directory\n");
}

TEST_F(TesselUsageTest, DirectoryWithoutJournalGoesOnToTheNextPlace) {
  std::filesystem::create_directory(directory / "j");
  writeFile(directory / "s", "Nov 21 17:34:18 phone call: x\n");
  EXPECT_EQ(run({"--journal-directory", directory / "j", "--syslog", directory / "s"}), 0);
  EXPECT_EQ(out, "Nov 21 17:34:18 phone call: x\n");
}

TEST_F(TesselUsageTest, FullDiskIsToldAndEndsIt) {
  writeFile(directory / "s", "Nov 21 17:34:18 phone call: x\n");
  ChildProgram child({.command = {ZAL_TESSEL_PATH, "--syslog", directory / "s"},
                      .output = "/dev/full",
                      .errors = directory / "err"});
  EXPECT_EQ(child.waitForExit(), 1);
  EXPECT_EQ(readFile(directory / "err"), "tessel: the output cannot be written: No space left on device\n");
}

}  // namespace
}  // namespace zal::testing
