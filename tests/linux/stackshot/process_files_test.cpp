#include "platform/linux/stackshot/process_files.h"

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using namespace stackshot;

TEST(StatLineTest, TheNameEndsAtTheLastBracketWhateverIsInIt) {
  const auto line = parseStatLine("12 (a) S 1 (b) D 34 12 12 0 -1 4194560 1 2\n");
  ASSERT_TRUE(line);
  EXPECT_EQ(line->name, "a) S 1 (b");
  EXPECT_EQ(line->state, 'D');
  EXPECT_EQ(line->parent, 34);
  EXPECT_FALSE(line->isKernel);
}

TEST(StatLineTest, KnowsTheKernelsOwnByTheirFlag) {
  const auto line = parseStatLine("2 (kthreadd) S 0 0 0 0 -1 2129984 0 0");
  ASSERT_TRUE(line);
  EXPECT_TRUE(line->isKernel);
}

TEST(StatLineTest, ATornLineIsNone) {
  for (const char* text : {"", "12", "12 (name", "12 (name)", "12 (name) S 1", ")(", "12 (n) S x 1 1 1 1 1"})
    EXPECT_FALSE(parseStatLine(text)) << text;
}

TEST(ProcessFilesTest, FindsItself) {
  EXPECT_THAT(allProcesses(), ::testing::Contains(::getpid()));
  EXPECT_THAT(threadsOf(::getpid()), ::testing::Contains(::getpid()));
  const auto self = readProcess(::getpid());
  ASSERT_TRUE(self);
  EXPECT_EQ(self->parent, ::getppid());
  EXPECT_EQ(self->user, ::geteuid());
  EXPECT_EQ(self->name, "linux_stackshot");  // the kernel keeps 15 bytes
  EXPECT_THAT(self->command, ::testing::HasSubstr("linux_stackshot_tests"));
  EXPECT_EQ(tracerOf(::getpid(), ::getpid()), 0);
}

TEST(ProcessFilesTest, WhatIsNotThereIsNone) {
  constexpr pid_t kNobody = 0x7ffffff0;
  EXPECT_FALSE(readProcess(kNobody));
  EXPECT_FALSE(readThread(kNobody, kNobody));
  EXPECT_TRUE(threadsOf(kNobody).empty());
  EXPECT_TRUE(kernelFramesOf(kNobody, kNobody).empty());
  EXPECT_EQ(stateOf(kNobody, kNobody), '?');
  EXPECT_EQ(tracerOf(kNobody, kNobody), 0);
}

}  // namespace
}  // namespace zal::testing
