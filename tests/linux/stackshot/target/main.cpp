// Somebody to look at, as the word says. A program of its own: a sanitizer would add threads to it.

#include <sched.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <csignal>
#include <string_view>
#include <thread>

namespace {
const volatile bool forEver = true;  // the compiler is not to know
}

// Functions that a stack is to show.
extern "C" [[gnu::noinline]] void zalSleepsInTheTest() {
  while (forEver) ::pause();
}

extern "C" [[gnu::noinline]] int zalSleepsDeepInTheTest(int depth) {
  if (depth == 0) {
    zalSleepsInTheTest();
    return 0;
  }
  return zalSleepsDeepInTheTest(depth - 1) + depth;
}

namespace {

void answer(int /*signal*/) {
  if (::write(STDOUT_FILENO, "!", 1) < 0) ::_exit(9);
}

void sleepWithOthers(int others) {
  struct sigaction answering {};
  answering.sa_handler = answer;
  ::sigaction(SIGUSR1, &answering, nullptr);
  for (int other = 0; other < others; ++other) std::thread(zalSleepsInTheTest).detach();
  zalSleepsDeepInTheTest(3);
}

/// Until the child that it makes has run a program, which it never does.
void sleepUninterruptibly() {
  if (::syscall(SYS_clone, CLONE_VFORK | SIGCHLD, nullptr, nullptr, nullptr, nullptr) != 0) return;
  ::prctl(PR_SET_PDEATHSIG, SIGKILL);
  zalSleepsInTheTest();
}

void endFirstThread() {
  std::thread(zalSleepsInTheTest).detach();
  ::syscall(SYS_exit, 0);
}

}  // namespace

int main(int count, char** words) {
  ::prctl(PR_SET_PDEATHSIG, SIGKILL);
  const std::string_view word = count == 2 ? words[1] : "";
  if (word == "alone") zalSleepsInTheTest();
  if (word == "two") sleepWithOthers(1);
  if (word == "five") sleepWithOthers(4);
  if (word == "deep") zalSleepsDeepInTheTest(400);
  if (word == "uninterruptible") sleepUninterruptibly();
  if (word == "headless") endFirstThread();
  return 0;
}
