#include "platform/linux/process/procfs_process_table.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <thread>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

std::string text(std::vector<ProcessEntry> table) {
  std::sort(table.begin(), table.end(),
            [](const auto& left, const auto& right) { return left.processId < right.processId; });
  std::string lines;
  for (const auto& entry : table) lines += std::to_string(entry.processId) + " " + entry.shortName + "\n";
  return lines;
}

TEST(ProcfsProcessTableTest, ReadsTheShortNameOfEachNumberedFolder) {
  const TemporaryDirectory root;
  writeFile(root / "1/comm", "init\n");
  writeFile(root / "4711/comm", "a name (x)\n");
  writeFile(root / "12/comm", "fifteen-letters-and-more\n");
  writeFile(root / "0/comm", "not a process\n");
  writeFile(root / "17x/comm", "not a process\n");
  writeFile(root / "99999999999999999999/comm", "not a process\n");
  writeFile(root / "uptime", "1\n");
  std::filesystem::create_directory(root / "77");  // ended between the listing and the reading
  const auto table = ProcfsProcessTable(root.path()).processes();
  ASSERT_TRUE(table);
  EXPECT_EQ(text(*table), "1 init\n12 fifteen-letters\n4711 a name (x)\n");
}

TEST(ProcfsProcessTableTest, ATableThatCannotBeReadIsNoTable) {
  const TemporaryDirectory root;
  EXPECT_FALSE(ProcfsProcessTable(root / "missing").processes());
}

TEST(ProcfsProcessTableTest, FindsARealChildByItsName) {
  const TemporaryDirectory directory;
  const std::string program = directory / "zal-test-child";
  std::filesystem::copy_file("/bin/sleep", program);
  const pid_t child = ::fork();
  if (child == 0) {
    ::execl(program.c_str(), program.c_str(), "60", nullptr);
    ::_exit(127);
  }
  const ProcfsProcessTable processes;
  bool found = false;
  for (const auto limit = std::chrono::steady_clock::now() + 50s;
       !found && std::chrono::steady_clock::now() < limit; std::this_thread::sleep_for(1ms)) {
    const auto table = processes.processes();
    ASSERT_TRUE(table);
    found = std::any_of(table->begin(), table->end(), [&](const ProcessEntry& entry) {
      return entry.processId == child && entry.shortName == "zal-test-child";
    });
  }
  EXPECT_TRUE(found);
  ::kill(child, SIGKILL);
  ::waitpid(child, nullptr, 0);
}

/// A process that has written a line to its standard output, which is one file, and has its errors
/// go to another; ended with this at the latest.
class Writer {
 public:
  Writer(const std::string& output, const std::string& errors) : _id(::fork()) {
    if (_id != 0) return;
    ::dup2(::open(output.c_str(), O_WRONLY | O_CREAT, 0600), STDOUT_FILENO);
    ::dup2(::open(errors.c_str(), O_WRONLY | O_CREAT, 0600), STDERR_FILENO);
    if (::write(STDOUT_FILENO, "line\n", 5) == 5) ::execl("/bin/sleep", "sleep", "600", nullptr);
    ::_exit(127);
  }
  ~Writer() {
    ::kill(_id, SIGKILL);
    ::waitpid(_id, nullptr, 0);
  }
  Writer(const Writer&) = delete;
  Writer& operator=(const Writer&) = delete;
  [[nodiscard]] pid_t id() const { return _id; }
  /// Ends it and leaves it to be waited for.
  void becomeZombie() const {
    ::kill(_id, SIGKILL);
    siginfo_t ended{};
    ::waitid(P_PID, static_cast<id_t>(_id), &ended, WEXITED | WNOWAIT);
  }

 private:
  pid_t _id;
};

class WritersBelowTest : public ::testing::Test {
 protected:
  WritersBelowTest() {
    for (const char* name : {"/a", "/ab"}) std::filesystem::create_directory(home + name);
  }
  /// Whether the process came to be the other program in time.
  static bool runs(const Writer& writer) {
    const std::string file = "/proc/" + std::to_string(writer.id()) + "/cmdline";
    const auto limit = std::chrono::steady_clock::now() + 50s;
    while (!readFile(file).starts_with("sleep") && std::chrono::steady_clock::now() < limit) {
      std::this_thread::sleep_for(1ms);
    }
    return readFile(file).starts_with("sleep");
  }
  [[nodiscard]] std::vector<FileWriter> writers() const { return processes.writersBelow(home + "/a"); }
  TemporaryDirectory directory;
  const std::string home = std::filesystem::canonical(directory.path()).string();
  const ProcfsProcessTable processes;
};

TEST_F(WritersBelowTest, AProcessIsFoundByItsOutputOrItsErrors) {
  const Writer output(home + "/a/out", "/dev/null"), errors("/dev/null", home + "/a/err");
  ASSERT_TRUE(runs(output) && runs(errors));
  std::vector<FileWriter> expected = {{output.id(), "sleep 600", home + "/a/out"},
                                      {errors.id(), "sleep 600", home + "/a/err"}};
  std::sort(expected.begin(), expected.end(),
            [](const FileWriter& a, const FileWriter& b) { return a.processId < b.processId; });
  EXPECT_EQ(writers(), expected);
}

TEST_F(WritersBelowTest, AProcessWithBothIsThereOnceByItsOutput) {
  const Writer writer(home + "/a/out", home + "/a/err");
  ASSERT_TRUE(runs(writer));
  EXPECT_EQ(writers(), (std::vector<FileWriter>{{writer.id(), "sleep 600", home + "/a/out"}}));
}

TEST_F(WritersBelowTest, FilesDeepBelowTheDirectoryCount) {
  std::filesystem::create_directories(home + "/a/WiFi/x");
  const Writer writer(home + "/a/WiFi/x/out", "/dev/null");
  ASSERT_TRUE(runs(writer));
  EXPECT_EQ(writers(), (std::vector<FileWriter>{{writer.id(), "sleep 600", home + "/a/WiFi/x/out"}}));
}

TEST_F(WritersBelowTest, ADirectoryWhoseNameGoesOnIsAnotherDirectory) {
  const Writer other(home + "/ab/out", "/dev/null");
  ASSERT_TRUE(runs(other));
  EXPECT_EQ(writers(), std::vector<FileWriter>{});
  EXPECT_EQ(processes.writersBelow(home + "/ab").size(), 1U);
}

TEST_F(WritersBelowTest, OneThatHasEndedIsGoneEvenBeforeItIsWaitedFor) {
  const Writer ended(home + "/a/out", "/dev/null"), alive(home + "/a/other", "/dev/null");
  ASSERT_TRUE(runs(ended) && runs(alive));
  ASSERT_EQ(writers().size(), 2U);
  ended.becomeZombie();
  ASSERT_TRUE(std::filesystem::exists("/proc/" + std::to_string(ended.id())));
  EXPECT_EQ(writers(), (std::vector<FileWriter>{{alive.id(), "sleep 600", home + "/a/other"}}));
}

TEST_F(WritersBelowTest, ThisProcessItselfIsNotAmongThem) {
  const int before = ::dup(STDOUT_FILENO);
  const int file = ::open((home + "/a/out").c_str(), O_WRONLY | O_CREAT, 0600);
  ::dup2(file, STDOUT_FILENO);
  const auto found = writers();
  ::dup2(before, STDOUT_FILENO);
  ::close(before);
  ::close(file);
  EXPECT_EQ(found, std::vector<FileWriter>{});
}

TEST(ProcfsProcessTableTest, AWriterWithoutArgumentsIsNamedByItsShortName) {
  const TemporaryDirectory root;
  for (const char* name : {"12", "7", "9"}) {
    writeFile(root / name + "/comm", std::string("name-") + name + "\n");
    std::filesystem::create_directory(root / name + "/fd");
  }
  using std::filesystem::create_symlink;
  create_symlink("/dump/WiFi/out (deleted)", root / "12/fd/1");
  create_symlink("/dump/err", root / "7/fd/2");
  create_symlink("pipe:[123]", root / "9/fd/1");
  writeFile(root / "7/cmdline", std::string("top\0-b\0-n 9\0", 13));
  EXPECT_EQ(ProcfsProcessTable(root.path()).writersBelow("/dump"),
            (std::vector<FileWriter>{{7, "top -b -n 9", "/dump/err"},
                                     {12, "name-12", "/dump/WiFi/out (deleted)"}}));
  EXPECT_EQ(ProcfsProcessTable(root / "missing").writersBelow("/dump"), std::vector<FileWriter>{});
}

TEST(ProcfsProcessTableTest, AFailedReadOfTheArgumentsLeavesTheShortName) {
  const TemporaryDirectory root;
  // It opens, and a read fails, as in the folder of a process that has just ended.
  std::filesystem::create_directories(root / "8/cmdline");
  std::filesystem::create_directories(root / "8/fd");
  std::filesystem::create_symlink("/dump/out", root / "8/fd/1");
  writeFile(root / "8/comm", "sleep\n");
  EXPECT_EQ(ProcfsProcessTable(root.path()).writersBelow("/dump"),
            (std::vector<FileWriter>{{8, "sleep", "/dump/out"}}));
}

}  // namespace
}  // namespace zal::testing
