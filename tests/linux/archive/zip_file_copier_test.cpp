#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/un.h>
#include <unistd.h>

#include "tests/linux/archive/archive_fixture.h"
#include "tests/support/real_places.h"

namespace zal::testing {
namespace {

class ZipFileCopierTest : public ArchiveFixture {
 protected:
  /// Text that compresses, different everywhere.
  static std::string text(std::size_t size) {
    std::string bytes;
    for (std::size_t line = 0; bytes.size() < size; ++line) {
      bytes += "line " + std::to_string(line * 7919 % 100'003) + " of a log\n";
    }
    return bytes.substr(0, size);
  }
  /// Bytes that do not.
  static std::string noise(std::size_t size) {
    std::string bytes;
    std::uint64_t state = 88172645463325252U;
    while (bytes.size() < size) {
      state ^= state << 13U;
      state ^= state >> 7U;
      state ^= state << 17U;
      bytes.append(reinterpret_cast<const char*>(&state), sizeof state);
    }
    return bytes.substr(0, size);
  }
};

INSTANTIATE_TEST_SUITE_P(Compression, ZipFileCopierTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

TEST_P(ZipFileCopierTest, HasTheDirectoryAsItsTopLevelAndEverythingInOrder) {
  writeFile(input("b.txt"), "second");
  writeFile(input("a/inner.txt"), "first");
  std::filesystem::create_directories(input("empty"));
  archive();
  EXPECT_EQ(completed, std::vector<std::string>{"the identifier of " + input()});
  EXPECT_EQ(log.lines, std::vector<std::string>{});
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "'"),
            "Dump/\nDump/a/\nDump/a/inner.txt\nDump/b.txt\nDump/empty/\n");
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_TRUE(std::filesystem::exists(input("b.txt")));
}

TEST_P(ZipFileCopierTest, GivesBackContentOfEveryKindAndLength) {
  constexpr std::size_t kChunk = 1U << 20U;
  writeFile(input("nothing"), "");
  writeFile(input("one byte"), "x");
  for (const std::size_t size : {kChunk - 1, kChunk, kChunk + 1, 5 * kChunk + 12345}) {
    writeFile(input("text" + std::to_string(size)), text(size));
    writeFile(input("noise" + std::to_string(size)), noise(size));
  }
  writeFile(input("changing"), text(3 * kChunk) + noise(2 * kChunk) + text(kChunk / 2) + noise(kChunk));
  writeFile(input("zeros"), std::string(3 * kChunk, '\0'));
  archive();
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_EQ(unpack(output(), files() + "/unpacked"), "");
  EXPECT_EQ(printed("diff -r '" + input() + "' '" + files() + "/unpacked/Dump'"), "");
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_P(ZipFileCopierTest, KeepsModesTimesAndLinks) {
  writeFile(input("private"), "1");
  writeFile(input("program"), "2");
  std::filesystem::create_directories(input("closed"));
  ::symlink("private", input("link").c_str());
  ::symlink("/nowhere/at all", input("dangling").c_str());
  ::chmod(input("private").c_str(), 0600);
  ::chmod(input("program").c_str(), 0755);
  ::chmod(input("closed").c_str(), 0700);
  setTime(input("private"), 1'500'000'001, 987'654'321);
  setTime(input("program"), 86'401, 0);
  setTime(input("link"), 1'600'000'003, 0);
  setTime(input("dangling"), 1'600'000'005, 0);
  setTime(input("closed"), 1'400'000'007, 0);
  setTime(input(), 1'300'000'009, 0);
  archive();
  EXPECT_EQ(unpack(output(), files() + "/unpacked"), "");
  // The program that unpacks does not set a link's own time.
  EXPECT_EQ(
      printed("cd '" + files() + "/unpacked/Dump' && find . ! -type l -printf '%P %y %m %Ts\\n' | sort"),
      printed("cd '" + input() + "' && find . ! -type l -printf '%P %y %m %Ts\\n' | sort"));
  EXPECT_EQ(std::filesystem::read_symlink(files() + "/unpacked/Dump/link"), "private");
  EXPECT_EQ(std::filesystem::read_symlink(files() + "/unpacked/Dump/dangling"), "/nowhere/at all");
  EXPECT_EQ(complaintsAbout(output()), "");
}

TEST_P(ZipFileCopierTest, GivesTimesBeforeAndAfterWhatTheFormatKnows) {
  for (const long time : {-86'400L, 315'532'799L, 2'147'483'647L, 2'147'483'648L, 4'500'000'000L}) {
    writeFile(input(std::to_string(time)), "x");
    setTime(input(std::to_string(time)), time, 0);
  }
  archive();
  EXPECT_EQ(log.lines, std::vector<std::string>{});
  EXPECT_EQ(complaintsAbout(output()), "");
}

TEST_P(ZipFileCopierTest, FlagsNamesAsUtf8) {
  writeFile(input("Gespräch – 会話 🙂.log"), "x");
  archive();
  EXPECT_EQ(printed("python3 -c 'import sys, zipfile; i = zipfile.ZipFile(sys.argv[1]).infolist()[1]; "
                    "print(i.filename, bool(i.flag_bits & 0x800))' '" +
                    output() + "'"),
            "Dump/Gespräch – 会話 🙂.log True\n");
  EXPECT_EQ(printed("bsdtar -tf '" + output() + "'"), "Dump/\nDump/Gespräch – 会話 🙂.log\n");
  EXPECT_EQ(complaintsAbout(output()), "");
}

TEST_P(ZipFileCopierTest, ReplacesBytesThatAreNoUtf8AndKeepsTheNamesApart) {
  writeFile(input("a\xFF.log"), "first");
  writeFile(input("a\xFE.log"), "second");
  writeFile(input("a\xEF\xBF\xBD.log"), "named so");
  archive();
  EXPECT_EQ(unpack(output(), files() + "/unpacked"), "");
  EXPECT_EQ(readFile(files() + "/unpacked/Dump/a\xEF\xBF\xBD.log"), "named so");
  EXPECT_EQ(readFile(files() + "/unpacked/Dump/a\xEF\xBF\xBD.log-2"), "second");
  EXPECT_EQ(readFile(files() + "/unpacked/Dump/a\xEF\xBF\xBD.log-3"), "first");
  EXPECT_EQ(log.lines,
            (std::vector<std::string>{"notice: A name in \"" + input() +
                                          "/\" is no UTF-8; in the archive it is \"a\xEF\xBF\xBD.log-2\"",
                                      "notice: A name in \"" + input() +
                                          "/\" is no UTF-8; in the archive it is \"a\xEF\xBF\xBD.log-3\""}));
}

TEST_P(ZipFileCopierTest, LeavesOutPipesSocketsAndDevicesWithALineEach) {
  writeFile(input("file"), "x");
  makeNamedPipe(input("pipe"));
  const int socket = ::socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  const std::string shortPath = "/proc/self/cwd/socket";
  const auto here = std::filesystem::current_path();
  std::filesystem::current_path(input());
  shortPath.copy(address.sun_path, sizeof address.sun_path - 1);
  EXPECT_EQ(::bind(socket, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
  std::filesystem::current_path(here);
  ::close(socket);
  std::vector<std::string> expected;
  if (::mknod(input("device").c_str(), S_IFCHR | 0600, makedev(1, 3)) == 0) {
    expected.push_back("notice: \"" + input("device") + "\" is left out of the archive: a device");
  }
  expected.push_back("notice: \"" + input("pipe") + "\" is left out of the archive: a pipe");
  expected.push_back("notice: \"" + input("socket") + "\" is left out of the archive: a socket");
  archive();
  EXPECT_EQ(log.lines, expected);
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "'"), "Dump/\nDump/file\n");
}

TEST_P(ZipFileCopierTest, StoresWhatIsCompressedAlready) {
  writeFile(input("long.gz"), noise(3U << 20U));
  writeFile(input("short.png"), noise(5000));
  writeFile(input("log.txt"), text(5000));
  archive();
  EXPECT_EQ(printed("python3 -c 'import sys, zipfile; print([(i.filename, i.compress_type) for i in "
                    "zipfile.ZipFile(sys.argv[1]).infolist()])' '" +
                    output() + "'"),
            "[('Dump/', 0), ('Dump/log.txt', 8), ('Dump/long.gz', 0), ('Dump/short.png', 0)]\n");
}

TEST_P(ZipFileCopierTest, AMissingInputMakesNoArchiveAndOneLine) {
  std::filesystem::remove_all(input());
  archive();
  EXPECT_EQ(log.lines, std::vector<std::string>{"notice: There is no \"" + input() + "\" to archive"});
  EXPECT_EQ(listTree(files()), "out/\n");
  EXPECT_EQ(completed.size(), 1U);
}

TEST_P(ZipFileCopierTest, AnInputThatIsAFileIsMovedAside) {
  std::filesystem::remove_all(input());
  writeFile(input(), "no directory");
  archive();
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: \"" + input() +
                                     "\" could not be archived (Not a directory); it is kept as \"" +
                                     input() + " (not archived)\""});
  EXPECT_EQ(listTree(files()), "Dump (not archived)\nout/\n");
  EXPECT_EQ(completed.size(), 1U);
}

TEST_P(ZipFileCopierTest, AnInputThatIsALinkIsNotFollowed) {
  std::filesystem::rename(input(), files() + "/elsewhere");
  ::symlink("elsewhere", input().c_str());
  archive();
  EXPECT_EQ(listTree(files()), "Dump (not archived)\nelsewhere/\nout/\n");
  EXPECT_EQ(log.lines.size(), 1U);
}

TEST_P(ZipFileCopierTest, AnInputBehindALinkBelowARootIsNeitherArchivedNorMovedAside) {
  writeFile(files() + "/elsewhere/Dump/file", "theirs");
  std::filesystem::create_directory(files() + "/root");
  std::filesystem::create_directory_symlink("../elsewhere", files() + "/root/Vistel");
  ZipFileCopier rooted(queues, log, GetParam(), {{files() + "/root"}, ""});
  const std::string behind = files() + "/root/Vistel/Dump";
  const auto job = rooted.makeJob(behind, output(), "behind", CopierOperation::compressIntoZip, queues.main(),
                                  [](FileCopierJob&) {});
  job->start();
  queues.runAll();
  EXPECT_FALSE(std::filesystem::exists(output()));
  EXPECT_EQ(listTree(files() + "/elsewhere"), "Dump/\nDump/file\n");
  const std::string why = "Too many levels of symbolic links";
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: \"" + behind + "\" could not be archived (" + why +
                                     "); it stays where it is, as it cannot be moved aside: " + why});
}

TEST_P(ZipFileCopierTest, WhatStandsAtTheOutputStaysAndTheInputIsMovedAside) {
  writeFile(input("file"), "x");
  writeFile(output(), "somebody's");
  archive();
  EXPECT_EQ(readFile(output()), "somebody's");
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: \"" + input() + "\" could not be archived (" + output() +
                                     ": File exists); it is kept as \"" + input() + " (not archived)\""});
  EXPECT_EQ(listTree(files()), "Dump (not archived)/\nDump (not archived)/file\nout/\nout/archive.zip\n");
}

TEST_P(ZipFileCopierTest, AnArchiveThatDoesNotReadBackIsRemovedAndTheInputMovedAside) {
  writeFile(input("file"), text(100'000));
  const auto job = makeJob(input(), output());
  job->start();
  ASSERT_TRUE(queues.runNext(kQueue));
  {
    std::fstream written(output(), std::ios::in | std::ios::out | std::ios::binary);
    written.seekp(static_cast<std::streamoff>(std::filesystem::file_size(output()) / 2));
    written << "damage";
  }
  EXPECT_EQ(completed.size(), 0U);
  queues.runAll();
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: \"" + input() +
                                       "\" could not be archived (the archive does not hold what was "
                                       "written: \"Dump/file\" "))
      << log.lines[0];
  EXPECT_EQ(listTree(files()), "Dump (not archived)/\nDump (not archived)/file\nout/\n");
  EXPECT_EQ(completed.size(), 1U);
}

TEST_P(ZipFileCopierTest, AJobThatItsOwnerDroppedEndsLikeAnyOther) {
  writeFile(input("file"), "x");
  makeJob(input(), output())->start();
  queues.runAll();
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_EQ(completed.size(), 1U);
}

TEST_P(ZipFileCopierTest, AJobThatIsNeverStartedDoesNothing) {
  makeJob(input(), output());
  queues.runAll();
  EXPECT_EQ(completed.size(), 0U);
  EXPECT_EQ(listTree(files()), "Dump/\nout/\n");
}

TEST_P(ZipFileCopierTest, ASlashAtTheEndChangesNothing) {
  writeFile(input("file"), "x");
  const auto job = makeJob(input() + "//", output());
  job->start();
  queues.runAll();
  EXPECT_EQ(printed("unzip -Z1 '" + output() + "'"), "Dump/\nDump/file\n");
}

TEST_P(ZipFileCopierTest, AnArchiveInsideItsInputDoesNotHoldItself) {
  writeFile(input("file"), "x");
  const auto job = makeJob(input(), input("archive.zip"));
  job->start();
  queues.runAll();
  EXPECT_EQ(printed("unzip -Z1 '" + input("archive.zip") + "'"), "Dump/\nDump/file\n");
}

}  // namespace
}  // namespace zal::testing
