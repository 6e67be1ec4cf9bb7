#include "platform/linux/stackshot/survey.h"

#include <sys/ptrace.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>

#include "platform/linux/stackshot/process_files.h"
#include "tests/linux/stackshot/target_process.h"
#include "tests/support/child_program.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using stackshot::Frame;
using stackshot::ProcessKind;
using stackshot::ProcessRecord;
using stackshot::Survey;
using stackshot::ThreadRecord;
using stackshot::TimeLeft;
using stackshot::Tracer;
using ::testing::IsEmpty;
using ::testing::IsSupersetOf;

std::vector<std::string> functionsOf(const ThreadRecord& thread) {
  std::vector<std::string> result;
  for (const Frame& frame : thread.frames) result.push_back(frame.function);
  return result;
}

class SurveyTest : public ::testing::Test {
 protected:
  ~SurveyTest() override { ::alarm(0); }
  ProcessRecord look(const TargetProcess& target) {
    auto process = survey.process(target.id());
    return process ? *process : ProcessRecord{};
  }

  TimeLeft timeLeft{60s};
  Survey survey{timeLeft};
};

TEST_F(SurveyTest, ShowsEveryThreadInTheFunctionsThatItIsIn) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  const ProcessRecord process = look(target);
  EXPECT_EQ(process.id, target.id());
  EXPECT_EQ(process.parent, ::getpid());
  EXPECT_EQ(process.user, ::getuid());
  EXPECT_EQ(process.state, 'S');
  EXPECT_EQ(process.threadCount, 2U);
  ASSERT_EQ(process.threads.size(), 2U);
  EXPECT_EQ(process.threads[0].id, target.id());
  EXPECT_THAT(functionsOf(process.threads[0]),
              IsSupersetOf({"zalSleepsInTheTest", "zalSleepsDeepInTheTest", "zalSleepsDeepInTheTest",
                            "zalSleepsDeepInTheTest", "zalSleepsDeepInTheTest", "main"}));
  EXPECT_THAT(functionsOf(process.threads[1]), ::testing::Contains("zalSleepsInTheTest"));
  for (const ThreadRecord& thread : process.threads) {
    EXPECT_EQ(thread.state, 'S');
    EXPECT_EQ(thread.trouble, "");
  }
}

TEST_F(SurveyTest, WhoWasLookedAtIsTracedByNobodyAndRunsOn) {
  int answers[2];
  ASSERT_EQ(::pipe(answers), 0);
  TargetProcess target("two", answers[1]);
  ASSERT_TRUE(target.becomes("SS"));
  EXPECT_FALSE(look(target).threads.empty());
  EXPECT_TRUE(target.isFree());
  EXPECT_TRUE(target.becomes("SS"));
  target.signal(SIGUSR1);
  char answer = 0;
  EXPECT_EQ(::read(answers[0], &answer, 1), 1);
  EXPECT_EQ(answer, '!');
  ::close(answers[0]);
  ::close(answers[1]);
}

TEST_F(SurveyTest, AStoppedProcessIsReadAndStaysStopped) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  target.signal(SIGSTOP);
  ASSERT_TRUE(target.becomes("TT"));
  const ProcessRecord process = look(target);
  ASSERT_EQ(process.threads.size(), 2U);
  EXPECT_EQ(process.threads[1].state, 'T');
  EXPECT_THAT(functionsOf(process.threads[1]), ::testing::Contains("zalSleepsInTheTest"));
  EXPECT_TRUE(target.isFree());
  EXPECT_TRUE(target.becomes("TT"));
  target.signal(SIGCONT);
  EXPECT_TRUE(target.becomes("SS"));
}

TEST_F(SurveyTest, AZombieHasEndedAndItsParentStillLearnsHow) {
  TargetProcess target([] { ::_exit(7); });
  ASSERT_TRUE(target.becomes("Z"));
  const ProcessRecord process = look(target);
  EXPECT_EQ(process.kind, ProcessKind::ended);
  EXPECT_EQ(process.state, 'Z');
  const int status = target.end();
  EXPECT_TRUE(WIFEXITED(status));
  EXPECT_EQ(WEXITSTATUS(status), 7);
}

TEST_F(SurveyTest, AProcessWhoseFirstThreadEndedHasTheStacksOfTheOthers) {
  TargetProcess target("headless");
  ASSERT_TRUE(target.becomes("ZS"));
  const ProcessRecord process = look(target);
  ASSERT_EQ(process.threads.size(), 2U);
  EXPECT_EQ(process.threads[0].trouble, "ended");
  EXPECT_THAT(functionsOf(process.threads[1]), ::testing::Contains("zalSleepsInTheTest"));
}

TEST_F(SurveyTest, AVanishedProcessIsNone) {
  TargetProcess target([] {});
  const pid_t id = target.id();
  target.end();
  EXPECT_FALSE(survey.process(id));
}

TEST_F(SurveyTest, AThreadThatSleepsUninterruptiblyHoldsNobodyUp) {
  TargetProcess target("uninterruptible");
  ASSERT_TRUE(target.becomes("D"));
  const ProcessRecord process = look(target);
  ASSERT_EQ(process.threads.size(), 1U);
  EXPECT_EQ(process.threads[0].state, 'D');
  EXPECT_EQ(process.threads[0].trouble, "sleeps uninterruptibly");
  EXPECT_TRUE(target.isFree());
}

TEST_F(SurveyTest, AThreadThatDoesNotStopInTimeIsLeftAndLetGoWhenItDoes) {
  TargetProcess target("uninterruptible");
  ASSERT_TRUE(target.becomes("D"));
  {
    Tracer tracer;
    EXPECT_EQ(tracer.hold(target.id(), std::chrono::steady_clock::now() + 10ms), std::errc::timed_out);
    // Whoever it waits for ends: it wakes up, stops for the tracer, and is let go with the next look.
    for (const pid_t id : stackshot::allProcesses()) {
      const auto process = stackshot::readProcess(id);
      if (process && process->parent == target.id()) ::kill(id, SIGKILL);
    }
    TargetProcess other("two");
    ASSERT_TRUE(other.becomes("SS"));
    ASSERT_TRUE(eventually([&] {
      EXPECT_FALSE(tracer.hold(other.id(), std::chrono::steady_clock::now() + 10s));
      return target.states() == "Z" || target.states().empty();
    })) << target.states();
  }
  EXPECT_EQ(target.end(), 0);
}

TEST_F(SurveyTest, WhoIsTracedAlreadyIsSaidToBe) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  ASSERT_EQ(::ptrace(PTRACE_SEIZE, target.id(), nullptr, nullptr), 0);
  // Our own tracing forbids it to others; another process looks.
  TargetProcess looking([&] {
    const auto process = Survey(timeLeft).process(target.id());
    const bool isSaid = process && process->threads.at(0).trouble == "traced by another process" &&
                        process->threads.at(1).trouble.empty();
    ::_exit(isSaid ? 0 : 1);
  });
  EXPECT_EQ(looking.end(), 0);
}

TEST_F(SurveyTest, DoesNotLookAtItself) {
  const auto process = survey.process(::getpid());
  ASSERT_TRUE(process);
  EXPECT_EQ(process->threads.at(0).trouble, "the program that writes this");
  EXPECT_THAT(process->threads[0].frames, IsEmpty());
}

TEST_F(SurveyTest, AnEndlessStackIsCutAndSaysSo) {
  TargetProcess target("deep");
  ASSERT_TRUE(target.becomes("S"));
  const ProcessRecord process = look(target);
  EXPECT_EQ(process.threads.at(0).frames.size(), 256U);
  EXPECT_EQ(process.threads[0].trouble, "more frames");
}

TEST_F(SurveyTest, OfTooManyThreadsTheFirstOnesAreShownAndAllCounted) {
  TargetProcess target("five");
  ASSERT_TRUE(target.becomes("SSSSS"));
  Survey few(timeLeft, {.threads = 3});
  const auto process = few.process(target.id());
  ASSERT_TRUE(process);
  EXPECT_EQ(process->threadCount, 5U);
  EXPECT_EQ(process->threads.size(), 3U);
}

TEST_F(SurveyTest, AThreadOfTheKernelShowsTheKernelsSide) {
  const auto ids = stackshot::allProcesses();
  for (const pid_t id : ids) {
    const auto process = stackshot::readProcess(id);
    if (!process || process->kind != ProcessKind::kernel) continue;
    const auto seen = survey.process(id);
    if (!seen) continue;
    EXPECT_EQ(seen->kind, ProcessKind::kernel);
    EXPECT_THAT(seen->threads.at(0).frames, IsEmpty());
    EXPECT_EQ(seen->threads[0].trouble, "");
    return;
  }
  GTEST_SKIP() << "no thread of the kernel is to be seen here";
}

TEST_F(SurveyTest, ToldToEndItStopsNobodyAnyMoreAndSaysSo) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  TargetProcess looking([&] {
    const TimeLeft own(60s);
    Survey ending(own);
    ::raise(SIGTERM);
    const auto process = ending.process(target.id());
    ::_exit(process && process->threads.at(1).trouble == "told to end" ? 0 : 1);
  });
  EXPECT_EQ(looking.end(), 0);
  EXPECT_TRUE(target.isFree());
}

TEST_F(SurveyTest, ToldToEndWhileItHangsItEndsAndEverybodyIsLetGo) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  TargetProcess hanging([&] {
    const TimeLeft own(60s);
    Tracer tracer;
    if (tracer.hold(target.id(), std::chrono::steady_clock::now() + 10s)) ::_exit(9);
    while (true) ::pause();
  });
  ASSERT_TRUE(target.becomes("tS"));
  hanging.signal(SIGTERM);
  const int status = hanging.end();
  EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 1) << status;
  EXPECT_TRUE(target.becomes("SS"));
  EXPECT_TRUE(target.isFree());
}

TEST_F(SurveyTest, KilledWhileItHoldsSomebodyItLetsThemGo) {
  TargetProcess target("two");
  ASSERT_TRUE(target.becomes("SS"));
  TargetProcess holding([&] {
    Tracer tracer;
    if (tracer.hold(target.id(), std::chrono::steady_clock::now() + 10s)) ::_exit(9);
    while (true) ::pause();
  });
  ASSERT_TRUE(target.becomes("tS"));
  holding.signal(SIGKILL);
  holding.end();
  EXPECT_TRUE(target.becomes("SS"));
  EXPECT_TRUE(target.isFree());
}

}  // namespace
}  // namespace zal::testing
