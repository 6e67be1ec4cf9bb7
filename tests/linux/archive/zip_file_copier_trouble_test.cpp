#include <fcntl.h>
#include <sys/fsuid.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <thread>

#include "platform/linux/archive/chunk_pipeline.h"
#include "tests/linux/archive/archive_fixture.h"
#include "tests/support/failing_calls.h"

namespace zal::testing {
namespace {

constexpr std::size_t kMebibyte = 1U << 20U;

/// Files and hosts that do not do what they should.
class ZipFileCopierTroubleTest : public ArchiveFixture {
 protected:
  /// False where the host lets no call fail.
  [[nodiscard]] bool archiveWhile(const FailingCall& failure) {
    const auto job = makeJob(input(), output());
    job->start();
    if (!withFailingCalls({failure}, [this] { queues.runNext(kQueue); })) return false;
    queues.runAll();
    return true;
  }
  void expectKeptBeside(const std::string& leftOut) {
    EXPECT_EQ(log.lines, (std::vector<std::string>{
                             "notice: \"" + leftOut + "\" is left out of the archive: Input/output error",
                             "warning: \"" + input() +
                                 "\" has more than could be read for its archive; it is kept as \"" +
                                 input() + " (not archived)\""}));
    EXPECT_EQ(readFile(input() + " (not archived)/broken"), "content");
    EXPECT_EQ(printed("unzip -Z1 '" + output() + "'"), "Dump/\nDump/whole\n");
    EXPECT_EQ(completed.size(), 1U);
  }
};

INSTANTIATE_TEST_SUITE_P(Compression, ZipFileCopierTroubleTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

/// A file that somebody writes to while it is read: what is there in the end is not the test's choice,
/// so only what must hold every time is asked for.
TEST_P(ZipFileCopierTroubleTest, AFileThatGrowsIsCutAtTheSizeThatItHad) {
  writeFile(input("growing"), std::string(3 * kMebibyte, 'a'));
  std::atomic<bool> stop{false};
  std::atomic<bool> grown{false};
  std::thread writer([&] {
    std::ofstream file(input("growing"), std::ios::app);
    while (!stop) {
      file << "more of it\n" << std::flush;
      grown = true;
    }
  });
  while (!grown) std::this_thread::yield();
  archive();
  stop = true;
  writer.join();
  EXPECT_EQ(log.lines, std::vector<std::string>{});
  EXPECT_EQ(complaintsAbout(output()), "");
  const std::string content = printed("unzip -p '" + output() + "' Dump/growing");
  EXPECT_GE(content.size(), 3 * kMebibyte);
  EXPECT_EQ(content, readFile(input("growing")).substr(0, content.size()));
}

TEST_P(ZipFileCopierTroubleTest, AFileThatShrinksIsStoredWithWhatWasRead) {
  writeFile(input("shrinking"), std::string(12 * kMebibyte, 'a'));
  writeFile(input("z"), "behind it");
  std::atomic<bool> stop{false};
  std::thread writer([&] {
    while (!stop) {
      ::truncate(input("shrinking").c_str(), kMebibyte / 2);
      ::truncate(input("shrinking").c_str(), 12 * kMebibyte);
    }
  });
  // Whether it is met half way is not the test's choice: until it was.
  std::size_t archives = 0;
  for (; log.lines.empty(); ++archives) {
    std::filesystem::remove(output());
    archive();
  }
  stop = true;
  writer.join();
  EXPECT_EQ(completed.size(), archives);
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_TRUE(log.lines[0].starts_with("notice: \"" + input("shrinking") + "\" is cut in the archive after "))
      << log.lines[0];
  EXPECT_TRUE(log.lines[0].ends_with(": it became shorter while it was read")) << log.lines[0];
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_EQ(printed("unzip -p '" + output() + "' Dump/z"), "behind it");
}

TEST_P(ZipFileCopierTroubleTest, AFileThatNobodyMayReadIsLeftOutWithALine) {
  writeFile(input("open"), "x");
  writeFile(input("secret"), "x");
  writeFile(input("closed/file"), "x");
  for (const auto& [name, mode] : {std::pair{"secret", 0}, {"closed", 0}, {"open", 0644}, {"", 0755}}) {
    ASSERT_EQ(::chmod(input(name).c_str(), static_cast<mode_t>(mode)), 0);
  }
  for (const std::string& directory : {files(), files() + "/out"}) ::chmod(directory.c_str(), 0777);
  // The superuser may read everything: reads as nobody does.
  const int before = ::setfsuid(65534);
  archive();
  ::setfsuid(static_cast<uid_t>(before));
  EXPECT_EQ(log.lines,
            (std::vector<std::string>{
                "notice: \"" + input("closed") + "\" is left out of the archive: Permission denied",
                "notice: \"" + input("secret") + "\" is left out of the archive: Permission denied"}));
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "'"), "Dump/\nDump/closed/\nDump/open\n");
  EXPECT_EQ(complaintsAbout(output()), "");
  ::chmod(input("closed").c_str(), 0755);
}

TEST_P(ZipFileCopierTroubleTest, AFileThatTheDiskFailsToReadIsKeptBesideItsArchive) {
  writeFile(input("broken"), "content");
  writeFile(input("whole"), "of another length");
  const FailingCall failure{SYS_pread64, EIO, 1, [](const std::uint64_t* words) { return words[2] == 7; }};
  if (!archiveWhile(failure)) GTEST_SKIP() << "the host lets no system call fail";
  expectKeptBeside(input("broken"));
}

TEST_P(ZipFileCopierTroubleTest, AFileThatTheDiskFailsToShowIsKeptBesideItsArchive) {
  writeFile(input("broken"), "content");
  writeFile(input("whole"), "of another length");
  if (!archiveWhile({SYS_newfstatat, EIO, 1, namesPath("broken")}))
    GTEST_SKIP() << "the host lets no system call fail";
  expectKeptBeside(input("broken"));
}

TEST_P(ZipFileCopierTroubleTest, WithoutDescriptorsNothingIsSilentlyLeftOut) {
  std::string deep = input();
  for (int level = 0; level < 60; ++level) deep += "/level";
  writeFile(deep + "/file", "x");
  rlimit before{};
  ASSERT_EQ(::getrlimit(RLIMIT_NOFILE, &before), 0);
  // The sanitizer looks at each kind of object once with descriptors of its own: now, not later.
  EXPECT_EQ(std::error_code(EMFILE, std::generic_category()).message(), "Too many open files");
  EXPECT_EQ(std::error_code(EMFILE, std::system_category()).message(), "Too many open files");
  const rlimit few{40, before.rlim_max};
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &few), 0);
  archive();
  ASSERT_EQ(::setrlimit(RLIMIT_NOFILE, &before), 0);
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: \"" + input() +
                                     "\" could not be archived (Too many open files); it is kept as \"" +
                                     input() + " (not archived)\""});
  EXPECT_FALSE(std::filesystem::exists(output()));
  EXPECT_EQ(completed.size(), 1U);
}

/// One chunk of a real file through the pipeline.
class ChunkPipelineTest : public ::testing::Test {
 protected:
  const ChunkResult& resultOf(int flags, std::size_t size, ZipMethod method) {
    writeFile(directory / "file", std::string(400, 'a'));
    ChunkTask task;
    task.file = std::make_shared<const Descriptor>(::open((directory / "file").c_str(), flags | O_CLOEXEC));
    task.size = size;
    task.method = method;
    pipeline.give(task);
    return pipeline.oldest();
  }
  const TemporaryDirectory directory;
  ChunkPipeline pipeline{ArchiveCompression::fast};
};

TEST_F(ChunkPipelineTest, AFileThatEndsEarlyGivesWhatItHas) {
  const ChunkResult& result = resultOf(O_RDONLY, 1000, ZipMethod::stored);
  EXPECT_EQ(result.read, 400U);
  EXPECT_EQ(std::string(result.bytes, result.size), std::string(400, 'a'));
  EXPECT_FALSE(result.error);
}

TEST_F(ChunkPipelineTest, AFileThatCannotBeReadSaysWhy) {
  const ChunkResult& result = resultOf(O_WRONLY, 400, ZipMethod::deflated);
  EXPECT_EQ(result.read, 0U);
  EXPECT_EQ(result.size, 0U);
  EXPECT_EQ(result.error, std::errc::bad_file_descriptor);
}

TEST_F(ChunkPipelineTest, ResultsComeInTheOrderOfTheTasks) {
  for (char letter = 'a'; letter <= 'z'; ++letter)
    writeFile(directory / std::string(1, letter), std::string(letter * 1000UL, letter));
  std::string order;
  const auto takeOldest = [&] {
    order += pipeline.oldest().bytes[0];
    pipeline.dropOldest();
  };
  std::size_t given = 0;
  for (char letter = 'a'; letter <= 'z'; ++letter) {
    if (pipeline.isFull()) takeOldest();
    ChunkTask task;
    task.file = std::make_shared<const Descriptor>(
        ::open((directory / std::string(1, letter)).c_str(), O_RDONLY | O_CLOEXEC));
    task.size = letter * 1000UL;
    task.method = ZipMethod::stored;
    pipeline.give(task);
    ++given;
  }
  while (order.size() < given) takeOldest();
  EXPECT_EQ(order, "abcdefghijklmnopqrstuvwxyz");
}

}  // namespace
}  // namespace zal::testing
