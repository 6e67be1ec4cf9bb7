#include <chrono>
#include <sstream>

#include "tests/linux/tessel/tessel_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class TesselSyslogTest : public TesselFixture {
 protected:
  void followFile() {
    writeFile(file, line("before"));
    follow({"--syslog", file}, [&](const std::string& probe) { append(file, line(probe)); });
  }
  static std::string line(const std::string& text) { return "Nov 21 17:34:18 phone call[7]: " + text + "\n"; }
  /// The time of so long ago, as a daemon with exact times writes it.
  static std::string ago(std::chrono::seconds age) {
    const auto moment =
        std::chrono::time_point_cast<std::chrono::seconds>(std::chrono::system_clock::now() - age);
    const auto day = std::chrono::floor<std::chrono::days>(moment);
    const std::chrono::year_month_day date(day);
    const std::chrono::hh_mm_ss time(moment - day);
    char text[64];
    std::snprintf(text, sizeof text, "%04d-%02u-%02uT%02d:%02d:%02d+00:00", int(date.year()),
                  unsigned(date.month()), unsigned(date.day()), int(time.hours().count()),
                  int(time.minutes().count()), int(time.seconds().count()));
    return text;
  }
  [[nodiscard]] std::string texts() const {
    std::string all;
    std::istringstream lines(out);
    for (std::string one; std::getline(lines, one);) {
      const std::size_t text = one.rfind(' ');
      all += one.substr(text + 1) + " ";
    }
    return all;
  }

  const std::string file = directory / "syslog";
};

TEST_F(TesselSyslogTest, EverythingIsPrintedThePredecessorFirst) {
  writeFile(file + ".1", line("old") + "stray \x1b[2J\nNov 21 17:34:18 phone call[7]: cut");
  writeFile(file, line("new") + "Nov 21 17:34:19 phone call[7]: unfinished");
  EXPECT_EQ(run({"--syslog", file}), 0);
  EXPECT_EQ(out, line("old") + "    | stray \\x1b[2J\n" + line("cut") + line("new") +
                     "Nov 21 17:34:19 phone call[7]: unfinished\n");
  EXPECT_EQ(err, "");
}

TEST_F(TesselSyslogTest, LookingBackKeepsWhatIsYoungEnoughAndTheLinesThatBelongToIt) {
  writeFile(file + ".1", ago(20min) + " phone a: a\n" + ago(4min) + " phone b: b\n");
  writeFile(file, "nothing-before\n" + ago(6min) + " phone c: c\nof-c\n" + ago(3min) + " phone d: d\nof-d\n" +
                      ago(10min) + " phone late: e\n");
  EXPECT_EQ(run({"-k", "Time", "ge", "-5m", "--syslog", file}), 0);
  EXPECT_EQ(texts(), "b nothing-before d of-d ");
  EXPECT_EQ(run({"-k", "Time", "ge", "-8m", "--syslog", file}), 0);
  EXPECT_EQ(texts(), "b nothing-before c of-c d of-d ");
  EXPECT_EQ(run({"-k", "Time", "ge", "-999999999d", "--syslog", file}), 0);
  EXPECT_EQ(texts(), "a b nothing-before c of-c d of-d e ");
}

TEST_F(TesselSyslogTest, FollowingSeesWhatIsAppendedAndNothingFromBefore) {
  followFile();
  EXPECT_EQ(printed().find("before"), std::string::npos);
  append(file, line("one"));
  EXPECT_TRUE(newsBecome(line("one"))) << news();
  append(file, line("two") + "Nov 21 17:34:19 phone call[7]: ha");
  EXPECT_TRUE(newsBecome(line("one") + line("two"))) << news();
  append(file, "lf\n");
  EXPECT_TRUE(newsBecome(line("one") + line("two") + "Nov 21 17:34:19 phone call[7]: half\n")) << news();
}

TEST_F(TesselSyslogTest, FollowingBeginsBehindALineThatIsJustBeingWritten) {
  writeFile(file, "Nov 21 17:34:18 phone call[7]: begun before");
  follow({"--syslog", file}, [&](const std::string& probe) { append(file, line(probe)); });
  EXPECT_EQ(printed().find("before"), std::string::npos) << printed();
}

TEST_F(TesselSyslogTest, FollowingGoesOverToTheNewFileAndLosesNothingOfTheOldOne) {
  followFile();
  std::filesystem::rename(file, file + ".1");
  append(file + ".1", line("still to the old file"));
  EXPECT_TRUE(newsBecome(line("still to the old file"))) << news();
  append(file, line("new file"));
  EXPECT_TRUE(newsBecome(line("still to the old file") + line("new file"))) << news();
  append(file + ".1", line("late"));
  EXPECT_TRUE(newsBecome(line("still to the old file") + line("new file") + line("late"))) << news();
  std::filesystem::rename(file, file + ".1");
  append(file, line("third file"));
  EXPECT_TRUE(
      newsBecome(line("still to the old file") + line("new file") + line("late") + line("third file")))
      << news();
}

TEST_F(TesselSyslogTest, FollowingStartsAgainWithAFileThatWasEmptied) {
  followFile();
  std::filesystem::resize_file(file, 0);
  append(file, line("after"));
  EXPECT_TRUE(newsBecome(line("after"))) << news();
}

TEST_F(TesselSyslogTest, FollowingSleepsWhileNothingComes) {
  followFile();
  EXPECT_TRUE(eventually([&] { return program->sleeps(); }));
}

TEST_F(TesselSyslogTest, KillingItLosesNoCompleteLine) {
  followFile();
  std::string all;
  for (int i = 0; i < 500; ++i) all += line(std::to_string(i));
  append(file, all);
  ASSERT_TRUE(eventually([&] { return !news().empty(); }));
  program->signal(SIGKILL);
  EXPECT_EQ(program->waitForExit(), -SIGKILL);
  const std::string got = news();
  EXPECT_EQ(got, all.substr(0, got.size()));
  EXPECT_EQ(got.back(), '\n') << "each line was written whole";
}

}  // namespace
}  // namespace zal::testing
