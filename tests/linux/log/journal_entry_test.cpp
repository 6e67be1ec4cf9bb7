#include "platform/linux/log/journal_entry.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/linux/log/listening_journal.h"

namespace zal {
namespace {

using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::Pair;

std::string encoded(const LogRecord& record) {
  std::string bytes;
  appendJournalEntry(bytes, record, "4711");
  return bytes;
}

TEST(JournalEntryTest, ARecordOfAClientByteByByte) {
  EXPECT_EQ(encoded({6, "Vistel", "Vistel-Event", false, "[a:b] one\ntwo", 99}),
            "PRIORITY=6\n"
            "SYSLOG_IDENTIFIER=zalloggingagent\n"
            "ZAL_TIME=99\n"
            "ZAL_TYPE\n\x06\0\0\0\0\0\0\0Vistel\n"
            "ZAL_CATEGORY\n\x0c\0\0\0\0\0\0\0Vistel-Event\n"
            "MESSAGE\n\x0d\0\0\0\0\0\0\0[a:b] one\ntwo\n"s);
}

TEST(JournalEntryTest, TheAgentsOwnLineHasItsProcessAndNoTime) {
  EXPECT_EQ(encoded({4, "T", "T", true, "x", 0}),
            "PRIORITY=4\n"
            "SYSLOG_IDENTIFIER=zalloggingagent\n"
            "SYSLOG_PID=4711\n"
            "ZAL_TYPE\n\x01\0\0\0\0\0\0\0T\n"
            "ZAL_CATEGORY\n\x01\0\0\0\0\0\0\0T\n"
            "MESSAGE\n\x01\0\0\0\0\0\0\0x\n"s);
}

TEST(JournalEntryTest, TheLargestTimeIsWritten) {
  EXPECT_THAT(testing::parsedEntry(encoded({6, "T", "T", false, "x", UINT64_MAX})),
              ElementsAre(Pair("PRIORITY", "6"), Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                          Pair("ZAL_TIME", "18446744073709551615"), Pair("ZAL_TYPE", "T"),
                          Pair("ZAL_CATEGORY", "T"), Pair("MESSAGE", "x")));
}

TEST(JournalEntryTest, LevelsThatTheJournalDoesNotKnowAreItsNearest) {
  for (const auto& [level, priority] : {std::pair{-3, "0"}, {0, "0"}, {7, "7"}, {8, "7"}, {12345, "7"}}) {
    EXPECT_THAT(testing::parsedEntry(encoded({level, "T", "T", false, "x", 0})).at(0),
                Pair("PRIORITY", priority));
  }
}

TEST(JournalEntryTest, NoTextOfAClientBecomesAFieldOfItsOwn) {
  for (const std::string& text :
       {"\nPRIORITY=0\n"s, "x\n\nMESSAGE=forged"s, "a\0b"s, "\xff\xfe\x80"s, ""s, "_PID=1\n"s, "\n"s}) {
    EXPECT_THAT(
        testing::parsedEntry(encoded({6, text, text + "-Event", false, text, 0})),
        ElementsAre(Pair("PRIORITY", "6"), Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                    Pair("ZAL_TYPE", text), Pair("ZAL_CATEGORY", text + "-Event"), Pair("MESSAGE", text)));
  }
}

}  // namespace
}  // namespace zal
