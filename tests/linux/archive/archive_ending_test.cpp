#include <sys/syscall.h>

#include <cerrno>

#include "tests/linux/archive/archive_fixture.h"
#include "tests/support/failing_calls.h"

namespace zal::testing {
namespace {

using Lines = std::vector<std::string>;

/// Archives that end with a text, whose content is kept for the test to look at.
class ArchiveEndingTest : public ArchiveFixture {
 protected:
  void archiveEndingWith(const std::string& text) {
    const auto job = makeJob(input(), output());
    job->endWith({"Manifest.json", [this, text](const ArchiveContent& all) {
                    content = all;
                    return text;
                  }});
    job->start();
    queues.runAll();
  }
  /// "name bytes sha256", as the tool of everyone's system has the last.
  [[nodiscard]] Lines rows() const {
    Lines found;
    for (const ArchivedFile& file : content.files) {
      found.push_back(file.name + " " + std::to_string(file.bytes) + " " + file.sha256);
    }
    return found;
  }
  [[nodiscard]] std::string sha256Of(const std::string& name) const {
    return printed("sha256sum < '" + input(name) + "'").substr(0, 64);
  }
  [[nodiscard]] std::string names() const { return printed("unzip -Z1 '" + output() + "'"); }

  ArchiveContent content;
};

INSTANTIATE_TEST_SUITE_P(Compression, ArchiveEndingTest,
                         ::testing::Values(ArchiveCompression::small, ArchiveCompression::fast),
                         compressionName);

TEST_P(ArchiveEndingTest, TheTextIsTheLastEntryBelowTheTopLevel) {
  writeFile(input("zebra"), "stripes");
  archiveEndingWith("what it holds\n");
  EXPECT_EQ(names(), "Dump/\nDump/zebra\nDump/Manifest.json\n");
  EXPECT_EQ(printed("unzip -p '" + output() + "' Dump/Manifest.json"), "what it holds\n");
  EXPECT_EQ(complaintsAbout(output()), "");
  EXPECT_FALSE(std::filesystem::exists(input("Manifest.json")));
}

TEST_P(ArchiveEndingTest, NameThatIsTakenGetsANumber) {
  writeFile(input("Manifest.json"), "a client's own");
  std::filesystem::create_directories(input("Manifest.json-2"));
  archiveEndingWith("ours");
  EXPECT_EQ(names(), "Dump/\nDump/Manifest.json\nDump/Manifest.json-2/\nDump/Manifest.json-3\n");
  EXPECT_EQ(printed("unzip -p '" + output() + "' Dump/Manifest.json-3"), "ours");
}

TEST_P(ArchiveEndingTest, EveryFileIsToldWithItsLengthAndHash) {
  writeFile(input("a/empty"), "");
  writeFile(input("a/small"), "abc");
  writeFile(input("large"), std::string((5U << 20U) + 77, 'x') + "end");
  std::filesystem::create_symlink("a/small", input("link"));
  archiveEndingWith("text");
  EXPECT_EQ(rows(), (Lines{"a/empty 0 e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855",
                           "a/small 3 ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad",
                           "large 5242960 " + sha256Of("large"),
                           // Of the text "a/small".
                           "link 7 " + printed("printf a/small | sha256sum").substr(0, 64)}));
}

TEST_P(ArchiveEndingTest, FilesThatAreStoredAndFilesFullOfZerosHaveTheirHashes) {
  writeFile(input("zeros"), std::string(3U << 20U, '\0'));
  ASSERT_EQ(printed("head -c 2500000 /dev/urandom > '" + input("noise") + "'"), "");
  archiveEndingWith("text");
  EXPECT_EQ(rows(), (Lines{"noise 2500000 " + sha256Of("noise"), "zeros 3145728 " + sha256Of("zeros")}));
}

TEST_P(ArchiveEndingTest, WhatIsLeftOutIsRemarked) {
  ASSERT_EQ(printed("mkfifo '" + input("pipe") + "'"), "");
  archiveEndingWith("text");
  EXPECT_EQ(content.remarks, Lines{'"' + input("pipe") + "\" is left out of the archive: a pipe"});
  EXPECT_EQ(log.lines, Lines{"notice: " + content.remarks.at(0)});
}

TEST_P(ArchiveEndingTest, TheTextIsThereWhereNothingCanBeRead) {
  writeFile(input("file"), "text");
  const auto job = makeJob(input(), output());
  job->endWith({"Manifest.json", [](const ArchiveContent&) { return std::string(1'500'000, 'm'); }});
  job->start();
  if (!withFailingCalls({{SYS_pread64, EIO, 1000}}, [this] { queues.runNext(kQueue); }))
    GTEST_SKIP() << "the host lets no system call fail";
  queues.runAll();
  EXPECT_EQ(names(), "Dump/\nDump/Manifest.json\n");
  EXPECT_EQ(printed("unzip -p '" + output() + "' Dump/Manifest.json | tr -d m"), "");
  EXPECT_EQ(printed("unzip -p '" + output() + "' Dump/Manifest.json | wc -c"), "1500000\n");
}

TEST_P(ArchiveEndingTest, WithoutATextThereIsNoEntryMore) {
  writeFile(input("file"), "text");
  const auto job = makeJob(input(), output());
  job->endWith({"Manifest.json", {}});
  job->start();
  queues.runAll();
  EXPECT_EQ(names(), "Dump/\nDump/file\n");
}

}  // namespace
}  // namespace zal::testing
