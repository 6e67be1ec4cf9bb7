#include "platform/linux/process/procfs_process_table.h"

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
  for (const auto limit = std::chrono::steady_clock::now() + 10s;
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

}  // namespace
}  // namespace zal::testing
