#include "dump/latest_link.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

namespace fs = std::filesystem;

class LatestLinkTest : public ::testing::Test {
 protected:
  void link(const std::string& service, const std::string& archive = "/dumps/Log.zip") {
    linkLatestArchive(files, home / "Logs", service, archive, log);
  }

  testing::TemporaryDirectory home;
  testing::RecordingAgentLog log;
  testing::PlainFilePlacement files{home.path()};
};

TEST_F(LatestLinkTest, LinksTheArchiveBesideTheServicesLogs) {
  fs::create_directories(home / "Logs/Vistel");
  link("Vistel");
  EXPECT_EQ(fs::read_symlink(home / "Logs/Vistel/Latest-Vistel"), "/dumps/Log.zip");
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(LatestLinkTest, ReplacesWhateverStandsThereWithoutTouchingWhatALinkLeadsTo) {
  testing::writeFile(home / "Logs/A/Latest-A", "a file");
  testing::writeFile(home / "Logs/B/Latest-B/inside.log", "a directory");
  testing::writeFile(home / "kept/archive.zip", "kept");
  fs::create_directories(home / "Logs/C");
  fs::create_directory_symlink(home / "kept", home / "Logs/C/Latest-C");
  for (const char* service : {"A", "B", "C"}) {
    link(service);
    const std::string place = home / ("Logs/" + std::string(service) + "/Latest-" + service);
    EXPECT_EQ(fs::read_symlink(place), "/dumps/Log.zip") << service;
  }
  EXPECT_EQ(testing::listTree(home / "kept"), "archive.zip\n");
}

TEST_F(LatestLinkTest, AnArchiveOfEarlierTakesTheLinkOnlyFromNoneOrAnOlderOne) {
  const std::string place = home / "Logs/Vistel/Latest-Vistel";
  for (const char* file : {"Logs/Vistel/Vistel.log", "older.zip", "middle.zip", "newest.zip"})
    testing::writeFile(home / file, "");
  const auto now = fs::last_write_time(home / "newest.zip");
  fs::last_write_time(home / "middle.zip", now - std::chrono::hours(1));
  fs::last_write_time(home / "older.zip", now - std::chrono::hours(2));
  const auto linkedAfter = [&](const std::string& archive) {
    linkArchiveOfEarlier(files, home / "Logs", "Vistel", home / archive, log);
    return fs::read_symlink(place).filename();
  };
  EXPECT_EQ(linkedAfter("middle.zip"), "middle.zip");
  EXPECT_EQ(linkedAfter("older.zip"), "middle.zip");
  EXPECT_EQ(linkedAfter("newest.zip"), "newest.zip");
  fs::remove(home / "newest.zip");
  EXPECT_EQ(linkedAfter("older.zip"), "older.zip");
}

/// A disk that refuses so many removals, and so many links.
class RefusingPlacement : public testing::PlainFilePlacement {
 public:
  using PlainFilePlacement::PlainFilePlacement;
  int refusals = 0;
  std::error_code remove(const std::string& path) override {
    return _refusedRemovals++ < refusals ? std::make_error_code(std::errc::io_error)
                                         : PlainFilePlacement::remove(path);
  }
  std::error_code linkSymbolically(const std::string& text, const std::string& path) override {
    return _refusedLinks++ < refusals ? std::make_error_code(std::errc::no_space_on_device)
                                      : PlainFilePlacement::linkSymbolically(text, path);
  }

 private:
  int _refusedRemovals = 0, _refusedLinks = 0;
};

TEST_F(LatestLinkTest, ADiskThatRefusesForAMomentDoesNotCostTheLink) {
  fs::create_directories(home / "Logs/Vistel");
  link("Vistel", "/dumps/older.zip");
  RefusingPlacement refusing(home.path());
  refusing.refusals = 1;
  linkLatestArchive(refusing, home / "Logs", "Vistel", "/dumps/Log.zip", log);
  EXPECT_EQ(fs::read_symlink(home / "Logs/Vistel/Latest-Vistel"), "/dumps/Log.zip");
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(LatestLinkTest, ADiskThatGoesOnRefusingIsToldOnce) {
  fs::create_directories(home / "Logs/Vistel");
  RefusingPlacement refusing(home.path());
  refusing.refusals = 100;
  linkLatestArchive(refusing, home / "Logs", "Vistel", "/dumps/Log.zip", log);
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: Could not link the latest archive at " +
                                     (home / "Logs/Vistel/Latest-Vistel") + ": Input/output error"});
}

TEST_F(LatestLinkTest, ServiceWithoutLogsHasNoPlaceForALinkAndNothingIsSaid) {
  link("Vistel");
  EXPECT_FALSE(fs::exists(home / "Logs"));
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(LatestLinkTest, NameThatLeadsOutOfTheLogRootIsRefusedWithOneWarning) {
  fs::create_directories(home / "out");
  fs::create_directories(home / "Logs/a/b");
  const std::vector<std::string> names{"../out", "..", ".", "/etc", "a/b", std::string("a\0b", 3)};
  for (const std::string& name : names) {
    log.lines.clear();
    link(name);
    EXPECT_EQ(log.lines.size(), 1U) << name;
  }
  log.lines.clear();
  link("../out\n");
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Refused the link to the latest archive of "
                                                "\"../out?\": its name leads out of the log directory"});
  EXPECT_EQ(testing::listTree(home.path()), "Logs/\nLogs/a/\nLogs/a/b/\nout/\n");
}

}  // namespace
}  // namespace zal
