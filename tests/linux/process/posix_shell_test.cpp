#include "platform/linux/process/posix_shell.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class PosixShellTest : public ::testing::Test {
 protected:
  int run(const std::string& line) { return shell.PerformSystem(line); }
  std::string outputOf(const std::string& command) {
    run(command + " > " + directory / "output");
    return readFile(directory / "output");
  }
  TemporaryDirectory directory;
  RecordingAgentLog log;
  PosixShell shell{log};
};

using Descriptors = std::map<std::string, std::string>;

/// What the process holds open; nothing when it is gone.
Descriptors descriptorsOf(pid_t process) {
  Descriptors found;
  std::error_code gone;
  std::filesystem::directory_iterator entry("/proc/" + std::to_string(process) + "/fd", gone);
  for (; !gone && entry != std::filesystem::directory_iterator(); entry.increment(gone)) {
    std::error_code closed;
    found[entry->path().filename()] = std::filesystem::read_symlink(entry->path(), closed);
  }
  return found;
}

/// A handler for the length of a test.
class SignalAction {
 public:
  SignalAction(int signal, void (*handler)(int)) : _signal(signal) {
    struct sigaction action {};
    action.sa_handler = handler;
    ::sigaction(signal, &action, &_before);
  }
  ~SignalAction() { ::sigaction(_signal, &_before, nullptr); }
  SignalAction(const SignalAction&) = delete;
  SignalAction& operator=(const SignalAction&) = delete;

 private:
  int _signal;
  struct sigaction _before {};
};

TEST_F(PosixShellTest, GivesTheWaitStatusOfTheShell) {
  EXPECT_EQ(run("true"), 0);
  const int seven = run("exit 7");
  EXPECT_TRUE(WIFEXITED(seven));
  EXPECT_EQ(WEXITSTATUS(seven), 7);
  const int killed = run("kill -KILL $$");
  EXPECT_TRUE(WIFSIGNALED(killed));
  EXPECT_EQ(WTERMSIG(killed), SIGKILL);
  EXPECT_EQ(WEXITSTATUS(run("/nonexistent/tool 2>/dev/null")), 127);
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(PosixShellTest, RunsTheLineThroughTheShell) {
  EXPECT_EQ(outputOf("(echo one; echo two) | tr a-z A-Z"), "ONE\nTWO\n");
}

TEST_F(PosixShellTest, StandardInputIsTheNullDevice) {
  EXPECT_EQ(outputOf("readlink /proc/self/fd/0"), "/dev/null\n");
  EXPECT_EQ(outputOf("cat"), "");
}

TEST_F(PosixShellTest, ABackgroundCommandOutlivesTheCallAndHoldsNoneOfOurDescriptors) {
  const int listener = ::socket(AF_UNIX, SOCK_STREAM, 0);  // without close-on-exec, on purpose
  const int high = ::fcntl(listener, F_DUPFD, 200);
  ASSERT_GE(high, 200);
  run("sleep 60 > /dev/null 2>&1 & echo $! > " + directory / "pid");
  const pid_t child = std::stoi(readFile(directory / "pid"));
  // A starting program opens its libraries for a moment; a descriptor of ours would stay for good.
  const Descriptors expected{{"0", "/dev/null"}, {"1", "/dev/null"}, {"2", "/dev/null"}};
  const std::string nameFile = "/proc/" + std::to_string(child) + "/comm";
  const auto limit = std::chrono::steady_clock::now() + 50s;
  Descriptors held;
  do {
    std::this_thread::sleep_for(1ms);
    held = descriptorsOf(child);
  } while ((readFile(nameFile) != "sleep\n" || held != expected) && std::chrono::steady_clock::now() < limit);
  EXPECT_EQ(held, expected);
  ::kill(child, SIGKILL);
  ::close(high);
  ::close(listener);
}

TEST_F(PosixShellTest, SignalsHaveTheirDefaultsInTheChildEvenWhereWeBlockOrIgnoreThem) {
  const SignalAction ignored(SIGPIPE, SIG_IGN), alsoIgnored(SIGTERM, SIG_IGN);
  sigset_t all, before;
  ::sigfillset(&all);
  ::pthread_sigmask(SIG_BLOCK, &all, &before);
  const int ended = run("kill -TERM $$; exit 0");
  const std::string blockedInChild = outputOf("sed -n 's/^SigBlk:.//p' /proc/self/status");
  const std::string ignoredInChild = outputOf("sed -n 's/^SigIgn:.//p' /proc/self/status");
  ::pthread_sigmask(SIG_SETMASK, &before, nullptr);
  EXPECT_TRUE(WIFSIGNALED(ended));
  EXPECT_EQ(WTERMSIG(ended), SIGTERM);
  EXPECT_EQ(blockedInChild, "0000000000000000\n");
  // Signals 32 and 33 are the C library's own; it ignores them in what it spawns.
  EXPECT_EQ(std::stoull(ignoredInChild, nullptr, 16) & ~0x180000000ULL, 0U) << ignoredInChild;
}

TEST_F(PosixShellTest, TakesACommandLineOfFourKibibytesAndFarMore) {
  for (const std::size_t size : {4096U, 100'000U}) {
    const std::string text(size, 'x');
    EXPECT_EQ(outputOf("printf %s " + text), text);
  }
}

TEST_F(PosixShellTest, ALineThatTheKernelRefusesIsLoggedAndGivesMinusOne) {
  EXPECT_EQ(run(": " + std::string(4U << 20U, 'x')), -1);
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Could not start /bin/sh: Argument list too long"});
}

TEST_F(PosixShellTest, AMissingShellIsLoggedAndGivesMinusOne) {
  PosixShell missing(log, directory / "no-shell");
  EXPECT_EQ(missing.PerformSystem("true"), -1);
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Could not start " + directory / "no-shell" +
                                                ": No such file or directory"});
}

TEST_F(PosixShellTest, SignalsThatArriveMeanwhileDoNotEndTheWait) {
  const SignalAction interrupting(SIGUSR1, [](int) {});  // no SA_RESTART: each breaks the wait
  std::atomic<bool> done = false;
  std::jthread disturber([&, target = ::pthread_self()] {
    while (!done) {
      ::pthread_kill(target, SIGUSR1);
      std::this_thread::sleep_for(1ms);
    }
  });
  EXPECT_EQ(WEXITSTATUS(run("sleep 0.1; exit 4")), 4);
  done = true;
}

TEST_F(PosixShellTest, LeavesOtherChildrenToTheirOwnWaiters) {
  const pid_t other = ::fork();
  if (other == 0) ::_exit(9);
  EXPECT_EQ(run("sleep 0.05"), 0);
  int status = 0;
  EXPECT_EQ(::waitpid(other, &status, 0), other);
  EXPECT_EQ(WEXITSTATUS(status), 9);
}

TEST_F(PosixShellTest, SeveralThreadsEachGetTheStatusOfTheirOwnCommand) {
  std::vector<int> statuses(8);
  {
    std::vector<std::jthread> threads;
    for (int i = 0; i < 8; ++i) {
      threads.emplace_back([&, i] { statuses[i] = WEXITSTATUS(run("exit " + std::to_string(10 + i))); });
    }
  }
  EXPECT_EQ(statuses, (std::vector<int>{10, 11, 12, 13, 14, 15, 16, 17}));
}

TEST_F(PosixShellTest, AnIgnoredSigchldFromOurParentDoesNotCostTheStatus) {
  const SignalAction ignored(SIGCHLD, SIG_IGN);
  PosixShell started(log);
  EXPECT_EQ(WEXITSTATUS(started.PerformSystem("exit 5")), 5);
}

}  // namespace
}  // namespace zal::testing
