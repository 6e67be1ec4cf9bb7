#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "platform/linux/archive/zip_contents.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"
#include "tests/linux/archive/archive_fixture.h"

namespace zal::testing {
namespace {

bool isSanitized() {
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
  return true;
#elif defined(__has_feature)
  return __has_feature(address_sanitizer) || __has_feature(thread_sanitizer);
#else
  return false;
#endif
}

class ZipFileCopierLoadTest : public ArchiveFixture {};

INSTANTIATE_TEST_SUITE_P(Compression, ZipFileCopierLoadTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

TEST_P(ZipFileCopierLoadTest, ThousandsOfSmallFiles) {
  const int count = isSanitized() || GetParam() == ArchiveCompression::small ? 2'000 : 20'000;
  for (int i = 0; i < count; ++i) {
    const std::string name = input("set" + std::to_string(i % 100));
    if (i < 100) std::filesystem::create_directories(name);
    std::ofstream(name + "/" + std::to_string(i) + ".log")
        << "the log of session " << i << ", which was short\n";
  }
  archive();
  EXPECT_EQ(log.lines, std::vector<std::string>{});
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "' | wc -l"), std::to_string(count + 101) + "\n");
  EXPECT_EQ(unpack(output(), files() + "/unpacked"), "");
  EXPECT_EQ(printed("diff -r '" + input() + "' '" + files() + "/unpacked/Dump'"), "");
}

/// What does not depend on the level is tried once.
class LargeArchiveTest : public ArchiveFixture {};

INSTANTIATE_TEST_SUITE_P(Compression, LargeArchiveTest, ::testing::Values(ArchiveCompression::fast),
                         compressionName);

TEST_P(LargeArchiveTest, MoreThanTheOldFormatCounts) {
  if (isSanitized())
    GTEST_SKIP() << "70,000 files take a sanitizer's build too long; the ordinary one does it";
  for (int i = 0; i < 70'000; ++i) std::ofstream(input(std::to_string(i)));
  archive();
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "' | wc -l"), "70001\n");
  EXPECT_EQ(complaintsAbout(output()), "");
}

TEST_P(LargeArchiveTest, AFileLargerThanTheOldFormatCounts) {
  if (isSanitized()) GTEST_SKIP() << "4 GiB take a sanitizer's build too long; the ordinary one does it";
  constexpr std::uint64_t kSize = (std::uint64_t{4} << 30U) + 4321;
  writeFile(input("a small one"), "before");
  writeFile(input("sparse"), "its beginning");
  std::filesystem::resize_file(input("sparse"), kSize);
  writeFile(input("z"), "behind it");
  archive();
  EXPECT_EQ(log.lines, std::vector<std::string>{});
  EXPECT_LT(std::filesystem::file_size(output()), kSize / 100);
  const std::string quoted = "'" + output() + "'";
  EXPECT_EQ(printed("bsdtar -tf " + quoted), "Dump/\nDump/a small one\nDump/sparse\nDump/z\n");
  EXPECT_EQ(printed("unzip -p " + quoted + " Dump/z"), "behind it");
  EXPECT_EQ(printed("python3 -c 'import sys, zipfile; z = zipfile.ZipFile(sys.argv[1]); "
                    "print([i.file_size for i in z.infolist()], z.read(\"Dump/z\"))' " +
                    quoted),
            "[0, 6, 4294971617, 9] b'behind it'\n");
  EXPECT_EQ(printed("unzip -p " + quoted + " Dump/sparse | cmp - '" + input("sparse") + "'"), "");
  const auto entries = listZip(output());
  ASSERT_TRUE(entries);
  ASSERT_EQ(entries->size(), 3U);
  EXPECT_EQ((*entries)[1].bytes, kSize);
  EXPECT_EQ(readZipEntry(output(), "Dump/z"), "behind it");
  EXPECT_EQ(readZipEntry(output(), "Dump/sparse"), std::nullopt);  // more than it reads
}

/// Real queues, two threads of them at work at once.
TEST_P(ZipFileCopierLoadTest, TwoJobsAtOnceAreTwoArchives) {
  for (const char* name : {"One", "Two"}) {
    for (int i = 0; i < 30; ++i) {
      writeFile(files() + "/" + name + "/" + std::to_string(i),
                std::string(100'000, static_cast<char>('a' + i)) + name);
    }
  }
  LinuxRunLoop realLoop;
  LinuxWorkQueues realQueues(realLoop, [](std::string_view line) { ADD_FAILURE() << line; });
  RecordingAgentLog quiet;  // nothing is left out, so nobody writes to it
  ZipFileCopier both(realQueues, quiet, GetParam());
  int done = 0;
  std::vector<std::shared_ptr<FileCopierJob>> jobs;
  for (const char* name : {"One", "Two"}) {
    jobs.push_back(both.makeJob(files() + "/" + name, files() + "/" + name + ".zip", name,
                                CopierOperation::compressIntoZip, realQueues.main(), [&](FileCopierJob&) {
                                  if (++done == 2) realLoop.stop();
                                }));
    jobs.back()->start();
  }
  realLoop.run();
  for (const std::string name : {"One", "Two"}) {
    const std::string archive = files() + "/" + name + ".zip";
    EXPECT_EQ(complaintsAbout(archive), "");
    EXPECT_EQ(unpack(archive, files() + "/of" + name), "");
    EXPECT_EQ(printed("diff -r '" + files() + "/" + name + "' '" + files() + "/of" + name + "/" + name + "'"),
              "");
  }
  EXPECT_EQ(quiet.lines, std::vector<std::string>{});
}

/// The output on a file system of one mebibyte with little of it left.
class FullDiskArchiveTest : public ArchiveFixture {
 protected:
  void SetUp() override {
    ArchiveFixture::SetUp();
    _disk = files() + "/disk";
    std::filesystem::create_directories(_disk);
    if (::mount("tmpfs", _disk.c_str(), "tmpfs", 0, "size=1m") != 0) {
      const int error = errno;
      _disk.clear();
      GTEST_SKIP() << "a tmpfs cannot be mounted here: " << std::strerror(error);
    }
  }
  void TearDown() override {
    if (!_disk.empty()) ::umount2(_disk.c_str(), MNT_DETACH);
  }
  [[nodiscard]] std::string disk(const std::string& name) const { return _disk + "/" + name; }
  void leaveRoom(std::size_t pages) {
    std::ofstream ballast(disk("ballast"), std::ios::binary);
    const std::string page(4096, 'x');
    while (ballast.write(page.data(), static_cast<std::streamsize>(page.size())).flush()) {
    }
    ballast.close();
    const auto size = std::filesystem::file_size(disk("ballast"));
    std::filesystem::resize_file(disk("ballast"), size - pages * page.size());
  }

 private:
  std::string _disk;
};

INSTANTIATE_TEST_SUITE_P(Compression, FullDiskArchiveTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

TEST_P(FullDiskArchiveTest, WhereverItFillsTheInputIsMovedAsideWithOneWarning) {
  std::string noise;
  for (unsigned i = 0; i < 400'000; ++i)
    noise += static_cast<char>((i * 2654435761U) >> 13U ^ i * 40503U >> 5U);
  for (const int file : {1, 2, 3})
    writeFile(input("noise" + std::to_string(file)), noise.substr(file * 1000));
  for (int i = 0; i < 500; ++i) writeFile(input("small/" + std::to_string(i)), "a small file");
  const std::string before = printed("cd '" + input() + "' && find . -type f | sort | xargs cat | md5sum");
  std::size_t failures = 0;
  for (const std::size_t pages : {0U, 1U, 2U, 16U, 60U, 63U, 64U, 65U, 100U, 128U, 200U, 250U}) {
    log.lines.clear();
    leaveRoom(pages);
    const auto job = makeJob(input(), disk("archive.zip"));
    job->start();
    queues.runAll();
    EXPECT_EQ(completed.size(), 1U) << pages;
    completed.clear();
    if (std::filesystem::exists(disk("archive.zip"))) {
      // There was room after all: then it is whole.
      EXPECT_EQ(log.lines, std::vector<std::string>{});
      EXPECT_EQ(complaintsAbout(disk("archive.zip")), "");
      continue;
    }
    ++failures;
    EXPECT_EQ(
        log.lines,
        std::vector<std::string>{"warning: \"" + input() +
                                 "\" could not be archived (No space left on device); it is kept as \"" +
                                 input() + " (not archived)\""})
        << pages;
    EXPECT_FALSE(std::filesystem::exists(input()));
    std::filesystem::rename(input() + " (not archived)", input());
    EXPECT_EQ(printed("cd '" + input() + "' && find . -type f | sort | xargs cat | md5sum"), before);
  }
  EXPECT_GE(failures, 8U);
}

}  // namespace
}  // namespace zal::testing
