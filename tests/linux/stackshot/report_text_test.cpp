#include "platform/linux/stackshot/report_text.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using namespace stackshot;

ProcessRecord userProcess() {
  ProcessRecord process{.id = 42,
                        .parent = 1,
                        .user = 1000,
                        .name = "player",
                        .command = "/usr/bin/player -v",
                        .state = 'S',
                        .threadCount = 3};
  ThreadRecord first{.id = 42, .name = "player", .state = 'S', .waitsIn = "do_epoll_wait"};
  first.frames = {{0x7f0000001234, false, "epoll_wait", 0x14, "/lib/libc.so.6"},
                  {0x401234, true, "", 0x1234, "/usr/bin/player"},
                  {0xdead, true, "", 0, ""}};
  first.trouble = "more frames";
  ThreadRecord second{.id = 43, .name = "audio", .state = 'D', .trouble = "sleeps uninterruptibly"};
  second.kernelFrames = {"io_schedule+0x46/0x80"};
  process.threads = {first, second};
  return process;
}

TEST(ReportTextTest, AProcessWithItsThreadsAndFrames) {
  EXPECT_EQ(processText(userProcess()), R"(Process 42 [player], S (sleeping), parent 1, user 1000, 3 threads
  Command: /usr/bin/player -v
  Thread 42 [player], S (sleeping), waits in do_epoll_wait
    #0   0x00007f0000001234 epoll_wait + 0x14 in /lib/libc.so.6
    #1   0x0000000000401234 0x1234 in /usr/bin/player
    #2   0x000000000000dead
    incomplete: more frames
  Thread 43 [audio], D (sleeping uninterruptibly)
    kernel: io_schedule+0x46/0x80
    no stack: sleeps uninterruptibly

)");
}

TEST(ReportTextTest, AnEndedProcessHasNoThreadsToShow) {
  ProcessRecord process{
      .id = 7, .parent = 6, .name = "gone", .state = 'Z', .kind = ProcessKind::ended, .threadCount = 1};
  EXPECT_EQ(processText(process),
            "Process 7 [gone], Z (ended), parent 6, user 0, 1 thread\n  ended, waits for its parent\n\n");
}

TEST(ReportTextTest, TextsOfOthersStayInTheirLine) {
  ProcessRecord process{
      .id = 8, .name = "a\nProcess 9 [b]", .command = "x\ny", .state = 'R', .threadCount = 0};
  EXPECT_EQ(processText(process),
            "Process 8 [a\\x0aProcess 9 [b]], R (running), parent 0, user 0, 0 threads\n"
            "  Command: x\\x0ay\n\n");
}

TEST(ReportTextTest, TheHeaderAddsUpWhatIsThereAndWhatIsNot) {
  ReportTotals totals;
  totals.add(userProcess());
  totals.add({.id = 2,
              .name = "kthreadd",
              .state = 'S',
              .kind = ProcessKind::kernel,
              .threadCount = 1,
              .threads = {{.id = 2, .name = "kthreadd", .state = 'S'}}});
  totals.add({.id = 7,
              .state = 'Z',
              .kind = ProcessKind::ended,
              .threadCount = 1,
              .threads = {{.id = 7, .state = 'Z'}}});
  ReportHeader header;
  header.title = "Stackshot of the machine";
  header.subject = {{"Reason", "because\nof this"}};
  header.code = 0xF33D1337;
  header.time = "2026-03-04 05:06:07.089 CET";
  header.host = "phone";
  header.kernel = "Linux 6.1";
  header.writer = "lirra-stackshot, process 5, user 0";
  header.microseconds = 137'004;
  header.longestHoldMicroseconds = 218;
  header.endedEarly = "time limit";
  EXPECT_EQ(headerText(header, totals), R"(Stackshot of the machine

Time:           2026-03-04 05:06:07.089 CET
Reason:         because\x0aof this
Code:           0xF33D1337
Host:           phone
Kernel:         Linux 6.1
Written by:     lirra-stackshot, process 5, user 0
Processes:      3, 1 of the kernel, 1 ended
Threads:        5, 1 stack
Left out:       1 thread of processes that have too many
Incomplete:     1 thread (more frames), 1 thread (sleeps uninterruptibly)
Duration:       137.004 ms, no thread held for more than 0.218 ms
Ended early:    time limit

)");
}

}  // namespace
}  // namespace zal::testing
