#include "platform/linux/process/process_identity.h"

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(ProcessIdentityTest, ThisProcessRuns) {
  const ProcessIdentity identity = ProcessIdentity::ofThisProcess();
  EXPECT_EQ(identity.processId, ::getpid());
  EXPECT_GT(identity.startTime, 0U);
  EXPECT_TRUE(identity.isRunning());
  EXPECT_EQ(identity, ProcessIdentity::ofThisProcess());
}

TEST(ProcessIdentityTest, AnotherStartTimeIsAnotherProcess) {
  ProcessIdentity identity = ProcessIdentity::ofThisProcess();
  ++identity.startTime;
  EXPECT_FALSE(identity.isRunning());
}

TEST(ProcessIdentityTest, AProcessThatWaitsToBeBuriedDoesNotRun) {
  int ready[2];
  ASSERT_EQ(::pipe(ready), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    // A name that looks like the fields after it.
    ::prctl(PR_SET_NAME, "a) Z 1 (b");
    const ProcessIdentity own = ProcessIdentity::ofThisProcess();
    const bool runs = own.isRunning();
    if (::write(ready[1], &own, sizeof own) < 0) ::_exit(2);
    ::_exit(runs ? 0 : 1);
  }
  ProcessIdentity identity;
  ASSERT_EQ(::read(ready[0], &identity, sizeof identity), static_cast<ssize_t>(sizeof identity));
  siginfo_t info{};
  ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(child), &info, WEXITED | WNOWAIT), 0);
  EXPECT_EQ(info.si_status, 0);
  EXPECT_EQ(identity.processId, child);
  EXPECT_FALSE(identity.isRunning());
  ::waitpid(child, nullptr, 0);
  EXPECT_FALSE(identity.isRunning());
  ::close(ready[0]);
  ::close(ready[1]);
}

TEST(ProcessIdentityTest, NobodyHasNoId) {
  EXPECT_FALSE((ProcessIdentity{0, 0}).isRunning());
  EXPECT_FALSE((ProcessIdentity{-1, 0}).isRunning());
}

}  // namespace
}  // namespace zal
