#include "platform/linux/log/log_set_name.h"

#include <gtest/gtest.h>

#include "platform/linux/log/rotation_names.h"

namespace zal {
namespace {

TEST(LogSetNameTest, APlainTypeIsItsOwnName) {
  for (const char* type : {"Vistel", "a", "Ünïcode 名", ".hidden", "...", "a.b"}) {
    EXPECT_EQ(logSetName(type), type);
    EXPECT_TRUE(isLogSetName(type)) << type;
  }
}

TEST(LogSetNameTest, OnlyTheLastPathComponentCounts) {
  EXPECT_EQ(logSetName("a/b/c"), "c");
  EXPECT_EQ(logSetName("/etc/passwd"), "passwd");
  EXPECT_EQ(logSetName("../../Vistel"), "Vistel");
  EXPECT_EQ(logSetName("Vistel//"), "Vistel");
}

TEST(LogSetNameTest, ATypeThatNamesNothingGoesToTheDefaultSet) {
  for (const char* type : {"", "/", "///", ".", "..", "a/..", "a/.", "../"}) {
    EXPECT_EQ(logSetName(type), "ZalLogging") << type;
    EXPECT_FALSE(isLogSetName(type)) << type;
  }
}

TEST(LogSetNameTest, ControlCharactersNeverReachAPath) {
  EXPECT_EQ(logSetName(std::string("a\nb\0c\x7f\x1b", 7)), "a_b_c__");
  EXPECT_FALSE(isLogSetName("a\nb"));
  EXPECT_FALSE(isLogSetName(std::string("a\0", 2)));
}

TEST(LogSetNameTest, ALongNameIsCutAtACharactersBoundary) {
  EXPECT_EQ(logSetName(std::string(214, 'x')), std::string(214, 'x'));
  EXPECT_EQ(logSetName(std::string(215, 'x')), std::string(214, 'x'));
  EXPECT_FALSE(isLogSetName(std::string(215, 'x')));
  EXPECT_EQ(logSetName(std::string(212, 'x') + "äö"), std::string(212, 'x') + "ä");
  EXPECT_EQ(logSetName(std::string(213, 'x') + "äö"), std::string(213, 'x'));
  EXPECT_EQ(logSetName(std::string(211, 'x') + "😀!"), std::string(211, 'x'));
  EXPECT_EQ(logSetName(std::string(300, '\x80')), std::string(214, '\x80'));
}

TEST(LogSetNameTest, TheLongestNameLeavesRoomForEveryEnding) {
  const std::string fileName = logFileName(logSetName(std::string(300, 'x')), true);
  EXPECT_EQ(readyName(fileName, UINT64_MAX).size(), 255U);
  EXPECT_LE(pendingName(fileName, UINT64_MAX).size(), 255U);
  EXPECT_LE(unfinishedZipName(fileName).size(), 255U);
  EXPECT_LE(generationName(fileName, 9).size() + std::string(".tmp").size(), 255U);
}

TEST(LogSetNameTest, AnEventIsRecordedUnderItsTypeFollowedByEvent) {
  EXPECT_TRUE(isEventCategory("Vistel", "Vistel-Event"));
  EXPECT_TRUE(isEventCategory("", "-Event"));
  EXPECT_FALSE(isEventCategory("Vistel", "Vistel"));
  EXPECT_FALSE(isEventCategory("Vistel", "Vistol-Event"));
  EXPECT_FALSE(isEventCategory("Vistel-Event", "Vistel-Event"));
  EXPECT_EQ(logFileName("Vistel", false), "Vistel.log");
  EXPECT_EQ(logFileName("Vistel", true), "Vistel-Event.log");
}

TEST(RotationNamesTest, ALeftoverIsReadBackFromItsName) {
  const std::string file = "X-Event.log";
  const auto pending = parseRotationLeftover(pendingName(file, 12));
  ASSERT_TRUE(pending);
  EXPECT_EQ(pending->kind, RotationLeftover::Kind::pending);
  EXPECT_EQ(pending->fileName, file);
  EXPECT_EQ(pending->sequence, 12U);
  const auto ready = parseRotationLeftover(readyName(file, UINT64_MAX));
  ASSERT_TRUE(ready);
  EXPECT_EQ(ready->kind, RotationLeftover::Kind::ready);
  EXPECT_EQ(ready->sequence, UINT64_MAX);
  const auto unfinished = parseRotationLeftover(unfinishedZipName(file));
  ASSERT_TRUE(unfinished);
  EXPECT_EQ(unfinished->kind, RotationLeftover::Kind::unfinishedZip);
  EXPECT_EQ(unfinished->fileName, file);
}

TEST(RotationNamesTest, OtherNamesAreNoLeftovers) {
  for (const char* name : {"", "X.log", "X.log.1.zip", "X.log.pending-", "X.log.pending-07",
                           "X.log.pending--1", "X.log.pending-1x", "X.pending-1", "X.log.ready-1",
                           "X.log.ready-.zip", "X.zip.tmp", "X.log.pending-18446744073709551616"}) {
    EXPECT_FALSE(parseRotationLeftover(name)) << name;
  }
}

}  // namespace
}  // namespace zal
