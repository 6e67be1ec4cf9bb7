#include <algorithm>
#include <csignal>
#include <cstdio>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "bench/servers/journald_server.h"
#include "tests/linux/log/mirroring_fixture.h"
#include "tests/support/child_program.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using ::testing::Contains;
using ::testing::ElementsAre;
using testing::JournalFields;
using ::testing::Pair;
using ::testing::SizeIs;

/// The entry without what the journal added, by name.
JournalFields sentFields(JournalFields fields) {
  std::erase_if(fields, [](const auto& field) { return field.first.starts_with('_'); });
  std::sort(fields.begin(), fields.end());
  return fields;
}

/// systemd-journald in a host of its own, read back with journalctl.
class RealJournalTest : public testing::MirroringFixture {
 protected:
  void SetUp() override {
    if (const std::string missing = journald.start(directory.path()); !missing.empty())
      GTEST_SKIP() << missing;
    if (bench::findProgram("journalctl").empty()) GTEST_SKIP() << "journalctl is not installed";
    useJournal(journald.socket());
  }
  /// All entries of a type, oldest first, once there are so many.
  std::vector<JournalFields> entries(const std::string& type, std::size_t count) {
    std::vector<JournalFields> all;
    testing::eventually([&] {
      all = testing::parsedEntries(exported("ZAL_TYPE=" + type));
      return all.size() >= count;
    });
    return all;
  }
  [[nodiscard]] std::string exported(const std::string& match) const {
    const std::string command =
        "journalctl --quiet --all --output=export --directory=" + journald.directory().string() + " '" +
        match + "'";
    FILE* const output = ::popen(command.c_str(), "r");
    std::string text;
    char buffer[65536];
    for (std::size_t size = 0; (size = std::fread(buffer, 1, sizeof buffer, output)) > 0;)
      text.append(buffer, size);
    ::pclose(output);
    return text;
  }

  bench::JournaldServer journald;
};

TEST_F(RealJournalTest, ARecordIsFoundByItsTypeWithAllItsFields) {
  mirroring->record({6, "Set", "Set-Event", false, "[a:b] one\ntwo", 7});
  loop.drain();
  const auto found = entries("Set", 1);
  ASSERT_THAT(found, SizeIs(1));
  EXPECT_THAT(sentFields(found[0]),
              ElementsAre(Pair("MESSAGE", "[a:b] one\ntwo"), Pair("PRIORITY", "6"),
                          Pair("SYSLOG_IDENTIFIER", "zalloggingagent"), Pair("ZAL_CATEGORY", "Set-Event"),
                          Pair("ZAL_TIME", "7"), Pair("ZAL_TYPE", "Set")));
  EXPECT_THAT(found[0], Contains(Pair("_PID", std::to_string(::getpid()))));
}

TEST_F(RealJournalTest, TheAgentsOwnLineIsThere) {
  agentLog.warning("disk is slow");
  loop.drain();
  const auto found = entries("ZalLogging", 1);
  ASSERT_THAT(found, SizeIs(1));
  EXPECT_THAT(sentFields(found[0]),
              ElementsAre(Pair("MESSAGE", "warning: disk is slow"), Pair("PRIORITY", "4"),
                          Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                          Pair("SYSLOG_PID", std::to_string(::getpid())), Pair("ZAL_CATEGORY", "ZalLogging"),
                          Pair("ZAL_TYPE", "ZalLogging")));
}

TEST_F(RealJournalTest, HostileAndHugeTextsComeBackAsTheyWere) {
  const std::vector<std::string> texts = {"\nPRIORITY=0\n",
                                          "a\0b"s,
                                          "\xff\x80",
                                          "x\n\nMESSAGE=y",
                                          "\x1b[2J",
                                          std::string(2'000'000, 'h'),
                                          "last"};
  for (const std::string& text : texts) {
    record(text);
    loop.drain();
  }
  const auto found = entries("Set", texts.size());
  ASSERT_THAT(found, SizeIs(texts.size()));
  for (std::size_t i = 0; i < texts.size(); ++i) {
    EXPECT_THAT(sentFields(found[i]), ElementsAre(Pair("MESSAGE", texts[i]), Pair("PRIORITY", "6"),
                                                  Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                                                  Pair("ZAL_CATEGORY", "Set"), Pair("ZAL_TYPE", "Set")))
        << i;
  }
}

TEST_F(RealJournalTest, ADaemonThatIsStoppedDelaysNothingAndEachRecordIsThereOrCounted) {
  burst(1);
  ASSERT_THAT(entries("Set", 1), SizeIs(1));
  ::kill(journald.processId(), SIGSTOP);
  burst(5000);
  EXPECT_EQ(kept(), 5001U);
  wait(1100ms);
  EXPECT_EQ(loop.pendingTimers(), 0U);
  ::kill(journald.processId(), SIGCONT);
  std::size_t there = 0;
  ASSERT_TRUE(testing::eventually([&] {
    wait(1s);
    burst(1);
    wait(1s);
    there = testing::parsedEntries(exported("ZAL_TYPE=ZalLogging")).size();
    return there > 0;
  }));
  wait(3s);
  // What was said tells how many of those that are in the files are missing.
  const std::string text = said();
  const std::string words = missedText(0).substr(0, missedText(0).size() - 1);
  const std::size_t line = text.find(words);
  ASSERT_NE(line, std::string::npos) << text;
  const auto missed = static_cast<std::size_t>(std::stoul(text.substr(line + words.size())));
  EXPECT_GT(missed, 1000U);
  EXPECT_EQ(entries("Set", kept() - missed).size(), kept() - missed) << text;
}

}  // namespace
}  // namespace zal
