#include "dump/log_compressor.h"

#include <gtest/gtest.h>

#include "tests/support/fake_platform.h"

namespace zal {
namespace {

namespace fs = std::filesystem;

class LogCompressorTest : public ::testing::Test {
 protected:
  LogCompressorTest() {
    gathered = host.home / "a/b/Log (x)";
    testing::writeFile(gathered + "/inner/line.log", "a line\n");
  }

  bool compress(const std::optional<std::string>& directory,
                const std::optional<std::string>& archive = std::nullopt) {
    return CompressDirectory(
        compressor, host.agentLog, directory, archive,
        [this](const std::optional<std::string>& path) { reported.push_back(path.value_or("none")); });
  }
  [[nodiscard]] std::string url(const std::string& path) const { return "file://" + (host.home / path); }

  testing::FakePlatform host;
  _LirraLogCompressor::Services services{
      .log = host.agentLog, .copier = host.fileCopier, .files = host.files, .queues = host.queues};
  _LirraLogCompressor compressor{services};
  std::string gathered;
  std::vector<std::string> reported;
};

TEST_F(LogCompressorTest, DirectoryWithoutAnArchiveLocationYieldsItsZipSiblingAndIsGone) {
  EXPECT_TRUE(compress(gathered));
  EXPECT_EQ(reported, std::vector<std::string>{});
  host.queues.runAll();
  EXPECT_EQ(reported, std::vector<std::string>{gathered + ".zip"});
  EXPECT_EQ(testing::listTree(host.home / "a"), "b/\nb/Log (x).zip\n");
  EXPECT_EQ(testing::readFile(gathered + ".zip"), "archive of " + gathered);
  EXPECT_EQ(host.agentLog.lines,
            (std::vector<std::string>{
                "notice: Compressing " + url("a/b/Log%20(x)") + " into nil",
                "notice: Starting zip of " + url("a/b/Log%20(x)") + " => " + url("a/b/Log%20(x).zip"),
                "notice: Done zipping log to path: " + url("a/b/Log%20(x).zip")}));
}

TEST_F(LogCompressorTest, JobCompressesTheDirectoryUnderItsPathIntoATemporaryPathThatEndsInTheArchivesName) {
  compress(gathered, host.home / "elsewhere.zip");
  ASSERT_EQ(host.fileCopier.started.size(), 1U);
  const auto& job = host.fileCopier.started[0];
  EXPECT_EQ(job.input, gathered);
  EXPECT_EQ(job.identifier, gathered);
  EXPECT_EQ(static_cast<int>(job.operation), 0);
  EXPECT_TRUE(job.output.ends_with("elsewhere.zip")) << job.output;
  host.queues.runAll();
  EXPECT_EQ(reported, std::vector<std::string>{host.home / "elsewhere.zip"});
  EXPECT_TRUE(fs::exists(host.home / "elsewhere.zip"));
}

TEST_F(LogCompressorTest, NoDirectoryReportsNothingAtOnceAndStartsNothing) {
  EXPECT_FALSE(compress(std::nullopt));
  EXPECT_EQ(reported, std::vector<std::string>{"none"});
  EXPECT_EQ(host.agentLog.lines, std::vector<std::string>{"notice: Compressing nil into nil"});
  EXPECT_TRUE(host.fileCopier.started.empty());
}

TEST_F(LogCompressorTest, NoDirectoryWithAnArchiveLocationNamesThatLocationInTheLog) {
  EXPECT_FALSE(compress(std::nullopt, host.home / "x.zip"));
  EXPECT_EQ(host.agentLog.lines, std::vector<std::string>{"notice: Compressing nil into " + url("x.zip")});
}

TEST_F(LogCompressorTest, ExistingArchiveStaysAndTheFreshOneStaysInTheTemporaryArea) {
  testing::writeFile(gathered + ".zip", "earlier");
  compress(gathered);
  const std::string temporary = host.fileCopier.started.at(0).output;
  host.queues.runAll();
  EXPECT_EQ(testing::readFile(gathered + ".zip"), "earlier");
  EXPECT_EQ(testing::readFile(temporary), "archive of " + gathered);
  // So that it is not taken for a leftover.
  EXPECT_EQ(fs::status(temporary).permissions() & fs::perms::owner_write, fs::perms::none);
  EXPECT_FALSE(fs::exists(gathered));
  EXPECT_EQ(reported, std::vector<std::string>{gathered + ".zip"});
}

TEST_F(LogCompressorTest, ArchiveIsReportedEvenWhenNoneCouldBeMade) {
  host.fileCopier.writesArchives = false;
  compress(gathered);
  host.queues.runAll();
  EXPECT_EQ(reported, std::vector<std::string>{gathered + ".zip"});
  EXPECT_FALSE(fs::exists(gathered + ".zip"));
}

TEST_F(LogCompressorTest, ADirectoryThatIsInNoArchiveStays) {
  host.fileCopier.writesArchives = false;
  compress(gathered);
  host.queues.runAll();
  EXPECT_TRUE(fs::exists(gathered));
}

TEST_F(LogCompressorTest, MissingPathsCompleteInsideTheCall) {
  int completions = 0;
  compressor.compressDirectory(std::nullopt, host.home / "x.zip", [&] { ++completions; });
  EXPECT_EQ(completions, 1);
  compressor.compressDirectory(gathered, std::nullopt, [&] { ++completions; });
  EXPECT_EQ(completions, 2);
  compressor.compressDirectory(std::nullopt, std::nullopt, {});
  host.queues.runAll();
  EXPECT_EQ(completions, 2);
  EXPECT_TRUE(fs::exists(gathered));
  EXPECT_TRUE(host.fileCopier.started.empty());
}

TEST_F(LogCompressorTest, JobsWithoutACompletionAreCarriedOutAllTheSame) {
  compressor.compressDirectory(gathered, gathered + ".zip", {});
  EXPECT_TRUE(CompressDirectory(compressor, host.agentLog, host.home / "nothing", std::nullopt, {}));
  EXPECT_FALSE(CompressDirectory(compressor, host.agentLog, std::nullopt, std::nullopt, {}));
  host.queues.runAll();
  EXPECT_TRUE(fs::exists(gathered + ".zip"));
  EXPECT_EQ(compressor.runningJobs(), 0U);
}

TEST_F(LogCompressorTest, JobsAreKeptFromTheirStartUntilTheirCompletionRan) {
  host.fileCopier.holdsBack = true;
  testing::writeFile(host.home / "second/line.log", "");
  std::size_t runningInCompletion = 99;
  compressor.compressDirectory(gathered, gathered + ".zip",
                               [&] { runningInCompletion = compressor.runningJobs(); });
  compress(host.home / "second");
  EXPECT_EQ(compressor.runningJobs(), 2U);
  host.fileCopier.heldBack.at(0)();
  host.queues.runAll();
  EXPECT_EQ(runningInCompletion, 1U);
  host.fileCopier.heldBack.at(1)();
  host.queues.runAll();
  EXPECT_EQ(compressor.runningJobs(), 0U);
  EXPECT_EQ(reported, std::vector<std::string>{host.home / "second.zip"});
}

TEST_F(LogCompressorTest, MoveAndDeletionStayOffTheMainThread) {
  compress(gathered);
  host.host.drain();
  EXPECT_TRUE(fs::exists(gathered));
  EXPECT_TRUE(host.queues.runNext("global.default"));
  EXPECT_TRUE(fs::exists(gathered + ".zip"));
  EXPECT_FALSE(fs::exists(gathered));
  EXPECT_TRUE(reported.empty());
  host.host.drain();
  EXPECT_EQ(reported.size(), 1U);
}

TEST_F(LogCompressorTest, DeletionFollowsNoLinks) {
  testing::writeFile(host.home / "kept/precious.log", "");
  fs::create_directory_symlink(host.home / "kept", gathered + "/inside");
  fs::create_directory_symlink(host.home / "kept", host.home / "link");
  compress(gathered);
  compress(host.home / "link/");
  host.queues.runAll();
  EXPECT_FALSE(fs::exists(gathered));
  EXPECT_FALSE(fs::is_symlink(host.home / "link"));
  EXPECT_TRUE(fs::exists(host.home / "kept/precious.log"));
  EXPECT_EQ(reported, (std::vector<std::string>{gathered + ".zip", host.home / "link.zip"}));
}

TEST_F(LogCompressorTest, NameThatFillsAFileNameLeavesRoomForTheRandomPartAndIsCutBetweenCharacters) {
  std::string name;
  for (int i = 0; i < 125; ++i) name += "\xC3\xA9";
  compress(host.home / (name + "x"));
  const std::string file = fs::path(host.fileCopier.started.at(0).output).filename().string();
  EXPECT_LE(file.size(), 255U);
  EXPECT_TRUE(file.ends_with("\xC3\xA9x.zip"));
  EXPECT_EQ(file.find('\xC3'), file.find('\xA9') - 1);
}

TEST_F(LogCompressorTest, SharedInstanceIsMadeOnceAndLastsUntilItsServicesAreTakenBack) {
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), nullptr);
  _LirraLogCompressor::lendServices(&services);
  _LirraLogCompressor* const first = _LirraLogCompressor::sharedInstance();
  ASSERT_NE(first, nullptr);
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), first);
  first->compressDirectory(gathered, gathered + ".zip", {});
  host.queues.runAll();
  EXPECT_TRUE(fs::exists(gathered + ".zip"));
  _LirraLogCompressor::lendServices(nullptr);
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), nullptr);
}

}  // namespace
}  // namespace zal
