#include "platform/linux/disk/file_kept_store.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "platform/linux/archive/zip_archive.h"
#include "platform/linux/blackbox/unnamed_spill_files.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/posix_file_placement.h"
#include "platform/linux/progress/progress_record.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr const char* kSession = "2024-05-02 at 14-03-07 (CEST) (Initiator)";
constexpr const char* kDump = "Vistel-Log (2024-05-02 at 14-03-07 (CEST))";

class FileKeptStoreTest : public ::testing::Test {
 protected:
  FileKeptStoreTest() { fs::create_directories(directory / "Reports"); }

  void put(const std::string& path, const std::string& content = "content") {
    writeFile(directory / path, content);
  }
  /// A session's or a dump's archive with that log in it, and a manifest unless that is empty.
  std::string archive(const std::string& name, const std::string& log = "",
                      const std::string& manifest = "{\"manifest\": 1}\n") {
    const std::string gathered = directory / ("gathered/" + name);
    writeFile(gathered + "/Quality Log (14-03-07).log", "[Failure Reason: only here]\n");
    writeFile(gathered + "/Log (14-03-07).log", log);
    const std::string path = directory / ("Reports/Vistel/" + name + ".zip");
    fs::create_directories(directory / "Reports/Vistel");
    ArchiveEnding ending;
    if (!manifest.empty()) ending = {"Manifest.json", [manifest](const ArchiveContent&) { return manifest; }};
    const auto outcome =
        writeZipArchive(gathered, path, ArchiveCompression::fast, ending, [](const auto&) {});
    EXPECT_EQ(outcome.failure, "");
    return path;
  }
  [[nodiscard]] std::string relative(const std::string& path) const {
    return path.substr(directory.path().size() + 1);
  }
  /// "path: kind of type, state" of each, sorted.
  std::vector<std::string> found() {
    std::vector<std::string> lines;
    for (const KeptItem& item : store.items()) {
      lines.push_back(relative(item.path) + ": " + std::string(keptKindText(item.kind)) + " of " + item.type +
                      (item.inUse.empty() ? "" : ", " + item.inUse) + (item.isLeftover ? ", leftover" : ""));
    }
    std::sort(lines.begin(), lines.end());
    return lines;
  }
  KeptItem only() {
    const auto items = store.items();
    EXPECT_EQ(items.size(), 1U);
    return items.empty() ? KeptItem{} : items[0];
  }
  bool isFailed() {
    std::vector<KeptItem> items{only()};
    store.findFailed(items);
    return items[0].hasFailed;
  }

  TemporaryDirectory directory;
  const std::string area = directory / "Reports/.area";
  PosixFilePlacement placement{directory / "home", area};
  FileKeptStore store{{.reports = directory / "Reports",
                       .userLogs = directory / "Logs",
                       .blackBox = directory / "BlackBox",
                       .progress = directory / "run/dumps",
                       .temporaryArea = area},
                      placement};
};

TEST_F(FileKeptStoreTest, SessionsDumpsAndStubsAreFoundByTheirNamesAndNothingElse) {
  put(std::string("Reports/Vistel/") + kSession + "/Log (14-03-07).log");
  put(std::string("Reports/Vistel/") + kDump + ".zip");
  put(std::string("Reports/Vistel/") + kDump + " (lost).Manifest.json");
  put(std::string("Reports/A/B/") + kDump + " (x/y).zip");
  put("Reports/Vistel/notes.txt");
  put("Reports/kernel.ips");
  put(std::string("Reports/") + kSession + "/no type above it");
  put(std::string("Reports/Vistel/") + kSession + ".zip/a directory of that name");
  EXPECT_THAT(found(),
              ElementsAre(std::string("Reports/A/B/") + kDump + " (x: dump of A",
                          std::string("Reports/Vistel/") + kSession + ": session of Vistel",
                          std::string("Reports/Vistel/") + kDump + " (lost).Manifest.json: stub of Vistel",
                          std::string("Reports/Vistel/") + kDump + ".zip: dump of Vistel"));
}

TEST_F(FileKeptStoreTest, AnItemSaysWhatItTakesAndWhenItChanged) {
  const std::string path = directory / (std::string("Reports/Vistel/") + kDump + ".zip");
  writeFile(path, std::string(100'000, 'x'));
  setTime(path, 1714651387, 251'000'000);
  const KeptItem item = only();
  struct stat status {};
  ::stat(path.c_str(), &status);
  EXPECT_EQ(item.bytes, static_cast<std::uint64_t>(status.st_blocks) * 512);
  EXPECT_EQ(item.changed, WallTime{std::chrono::milliseconds{1714651387251}});
  EXPECT_FALSE(item.isElsewhere);
}

TEST_F(FileKeptStoreTest, LinksBelowTheRootAreNeitherFollowedNorItems) {
  put(std::string("elsewhere/") + kDump + ".zip");
  fs::create_directory_symlink(directory / "elsewhere", directory / "Reports/Vistel");
  fs::create_directory(directory / "Reports/Nexa");
  fs::create_symlink(directory / (std::string("elsewhere/") + kDump + ".zip"),
                     directory / (std::string("Reports/Nexa/") + kDump + ".zip"));
  EXPECT_THAT(found(), IsEmpty());
}

TEST_F(FileKeptStoreTest, AWayThatBecameALinkIsNotGoneForRemoving) {
  put(std::string("Reports/Vistel/") + kDump + ".zip");
  const KeptItem item = only();
  fs::rename(directory / "Reports/Vistel", directory / "elsewhere");
  fs::create_directory_symlink(directory / "elsewhere", directory / "Reports/Vistel");
  EXPECT_TRUE(store.remove(item));
  EXPECT_TRUE(fs::exists(directory / (std::string("elsewhere/") + kDump + ".zip")));
}

TEST_F(FileKeptStoreTest, WhatBelongsToAnotherUserIsNotSeen) {
  put(std::string("Reports/Vistel/") + kDump + ".zip");
  const std::string path = directory / (std::string("Reports/Vistel/") + kDump + ".zip");
  if (::chown(path.c_str(), 65534, 65534) != 0) GTEST_SKIP() << "only the superuser gives files away";
  EXPECT_THAT(found(), IsEmpty());
}

TEST_F(FileKeptStoreTest, WhatTheLatestLinkLeadsToStays) {
  put(std::string("Reports/Vistel/") + kDump + ".zip");
  fs::create_directories(directory / "Logs/Vistel");
  fs::create_symlink(directory / (std::string("Reports/Vistel/") + kDump + ".zip"),
                     directory / "Logs/Vistel/Latest-Vistel");
  EXPECT_EQ(only().inUse, "the latest of its type");
}

TEST_F(FileKeptStoreTest, DirectoryAndArchiveOfACollectionThatGoesOnStay) {
  const std::string gathered = std::string("Reports/Vistel/") + kDump;
  put(gathered + "/Reason.txt");
  put(gathered + ".zip");
  const auto begin = [&](const ProcessIdentity& agent) {
    writeFile(directory / "run/dumps/0001714651387251-1-1.progress",
              progressBeginText("Vistel", directory / gathered, {"Archive"}, WallTime{}, agent));
  };
  begin(ProcessIdentity::ofThisProcess());
  EXPECT_THAT(found(), ElementsAre(gathered + ".zip: dump of Vistel, being collected",
                                   gathered + ": dump of Vistel, being collected"));
  begin({});  // an agent that is gone
  EXPECT_THAT(found(), ElementsAre(gathered + ".zip: dump of Vistel", gathered + ": dump of Vistel"));
}

TEST_F(FileKeptStoreTest, AnArchiveThatSomebodyReadsOrHasLockedStays) {
  const std::string path = archive(kSession);
  EXPECT_EQ(only().inUse, "");
  const KeptItem item = only();
  {
    const Descriptor reader(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_EQ(only().inUse, "open or locked");
    EXPECT_EQ(store.remove(item), std::errc::device_or_resource_busy);
    EXPECT_TRUE(fs::exists(path));
  }
  EXPECT_FALSE(store.remove(item));
  EXPECT_FALSE(fs::exists(path));
}

TEST_F(FileKeptStoreTest, ADirectoryThatSomebodyHasLockedStays) {
  put(std::string("Reports/Vistel/") + kSession + "/Log (14-03-07).log");
  const Descriptor locked(
      ::open((directory / (std::string("Reports/Vistel/") + kSession)).c_str(), O_RDONLY | O_CLOEXEC));
  ASSERT_EQ(::flock(locked.get(), LOCK_SH), 0);
  EXPECT_EQ(only().inUse, "open or locked");
}

TEST_F(FileKeptStoreTest, ARemovedArchiveLeavesItsManifest) {
  archive(kSession, "log\n", "{\"manifest\": 1, \"files\": []}\n");
  EXPECT_FALSE(store.remove(only()));
  const std::string stub = std::string("Reports/Vistel/") + kSession + ".Manifest.json";
  EXPECT_EQ(readFile(directory / stub), "{\"manifest\": 1, \"files\": []}\n");
  EXPECT_THAT(found(), ElementsAre(stub + ": stub of Vistel"));
  EXPECT_EQ(listTree(area), "");
  EXPECT_FALSE(store.remove(only()));
  EXPECT_THAT(found(), IsEmpty());
}

TEST_F(FileKeptStoreTest, ArchivesWithoutAManifestThatIsDamagedOrTooLongLeaveNothing) {
  const std::string path = archive(kSession, "log\n", "");
  EXPECT_FALSE(store.remove(only()));
  EXPECT_THAT(found(), IsEmpty());
  fs::remove_all(directory / "gathered");
  archive(kSession, "log\n", std::string((1U << 20U) + 1, ' '));
  EXPECT_FALSE(store.remove(only()));
  EXPECT_THAT(found(), IsEmpty());
  writeFile(path, "no archive");
  EXPECT_FALSE(store.remove(only()));
  EXPECT_THAT(found(), IsEmpty());
}

TEST_F(FileKeptStoreTest, OnADiskWithoutRoomTheStubTakesTheRoomOfItsArchive) {
  const std::string path = archive(kSession, std::string(20'000, 'x'));
  const std::string content = readFile(path);
  const TinyFileSystem disk(directory / "Reports");
  if (!disk.missing.empty()) GTEST_SKIP() << disk.missing;
  put(std::string("Reports/Vistel/") + kSession + ".zip", content);
  (void)placement.randomTemporaryPath("");
  put("Reports/ballast", std::string(1U << 16U, 'x'));
  ASSERT_LT(store.room().free, 4096U);
  EXPECT_FALSE(store.remove(only()));
  EXPECT_EQ(readFile(directory / (std::string("Reports/Vistel/") + kSession + ".Manifest.json")),
            "{\"manifest\": 1}\n");
}

TEST_F(FileKeptStoreTest, ADirectoryGoesWithAllBelowIt) {
  put(std::string("Reports/Vistel/") + kDump + " (not archived)/a/b");
  EXPECT_FALSE(store.remove(only()));
  EXPECT_EQ(listTree(directory / "Reports"), "Vistel/\n");
}

TEST_F(FileKeptStoreTest, ASessionFailedWhenItsLogHasAHeaderLineThatSaysSo) {
  const std::string log = std::string("Reports/Vistel/") + kSession + "/Log (14-03-07).log";
  put(log, "[Recipient ID: a]\n[Failure Reason: no answer]\n");
  EXPECT_TRUE(isFailed());
  put(log, "[Recipient ID: a]\nshe said [Failure Reason: no answer]\n");
  EXPECT_FALSE(isFailed());
}

TEST_F(FileKeptStoreTest, AnArchivedSessionFailedWhenTheLogInItSaysSo) {
  archive(kSession, "[Failure Reason: no answer]\n" + std::string(1'000'000, 'x'));
  EXPECT_TRUE(isFailed());
  fs::remove_all(directory / "Reports");
  archive(kSession, "[Recipient ID: a]\n");
  EXPECT_FALSE(isFailed());
}

TEST_F(FileKeptStoreTest, OfTheRecordsOnlyThoseThatWereSetAsideMayGo) {
  const std::string number = "0123456789abcdef0123456789abcdef";
  put("BlackBox/" + number + ".session");
  put("BlackBox/" + number + ".session.tried");
  put("BlackBox/" + number + ".session.damaged");
  put("BlackBox/else");
  const std::string goesOn = ": record of , a session goes on or is to be recovered";
  const std::string record = "BlackBox/" + number + ".session";
  EXPECT_THAT(found(),
              ElementsAre(record + ".damaged: record of ", record + ".tried" + goesOn, record + goesOn));
  for (const KeptItem& item : store.items()) {
    if (!item.inUse.empty()) continue;
    EXPECT_FALSE(store.remove(item));
  }
  EXPECT_THAT(found(), ElementsAre(record + ".tried" + goesOn, record + goesOn));
}

TEST_F(FileKeptStoreTest, LinesOfALongSessionThatHaveNoNameCountAsLongAsTheyAreThere) {
  std::filesystem::create_directories(directory / "real");
  std::filesystem::create_directory_symlink(directory / "real", directory / "BlackBox");
  std::filesystem::permissions(directory / "real", std::filesystem::perms::owner_all);
  UnnamedSpillFiles spillFiles(directory / "real");
  const auto lines = spillFiles.make(), none = spillFiles.make();
  ASSERT_TRUE(lines->append(std::string(1U << 20U, 'x'))) << lines->trouble();
  put("BlackBox/named");
  const KeptItem item = only();
  EXPECT_EQ(item.kind, KeptKind::temporary);
  EXPECT_GE(item.bytes, 1U << 20U);
  EXPECT_EQ(item.inUse, "lines of a session that goes on");
  EXPECT_EQ(item.path.find("deleted"), std::string::npos) << item.path;
}

TEST_F(FileKeptStoreTest, LinesThatAreGoneCountNoLonger) {
  std::filesystem::create_directories(directory / "BlackBox");
  std::filesystem::permissions(directory / "BlackBox", std::filesystem::perms::owner_all);
  UnnamedSpillFiles spillFiles(directory / "BlackBox");
  auto lines = spillFiles.make();
  ASSERT_TRUE(lines->append("a line")) << lines->trouble();
  EXPECT_EQ(store.items().size(), 1U);
  lines.reset();
  EXPECT_EQ(store.items().size(), 0U);
}

TEST_F(FileKeptStoreTest, HalfMadeArchivesStayAsLongAsTheirAgentLivesAndAreLeftoversThen) {
  {
    PosixFilePlacement agent(directory / "home", area);
    writeFile(agent.randomTemporaryPath("half.zip"), "half");
    const KeptItem item = only();
    EXPECT_EQ(item.inUse, "being written");
    EXPECT_FALSE(item.isLeftover);
  }
  EXPECT_TRUE(only().isLeftover);
  EXPECT_FALSE(store.remove(only()));
  EXPECT_THAT(found(), IsEmpty());
}

TEST_F(FileKeptStoreTest, ARootThatIsMissingHasNothingInItAndNoRoomThatCouldBeTold) {
  fs::remove_all(directory / "Reports");
  EXPECT_THAT(found(), IsEmpty());
  EXPECT_EQ(store.room().total, 0U);
}

TEST_F(FileKeptStoreTest, RoomIsThatOfTheFileSystemOfTheReports) {
  EXPECT_GT(store.room().total, store.room().free);
  EXPECT_EQ(store.room().total, fs::space(directory / "Reports").capacity);
}

}  // namespace
}  // namespace zal::testing
