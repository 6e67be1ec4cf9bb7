#pragma once

#include <fcntl.h>

#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "platform/linux/log/file_log_facility.h"
#include "platform/linux/log/linux_agent_log.h"
#include "platform/linux/log/mirroring_log_facility.h"
#include "platform/linux/log/record_text.h"
#include "tests/linux/log/listening_journal.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

/// The whole way: the agent's own log speaks into the facility that it is about.
class MirroringFixture : public ::testing::Test {
 protected:
  MirroringFixture() { useJournal(path); }
  ~MirroringFixture() override { agentLog.setLogFacility(nullptr); }
  /// Before the first record, when the journal is elsewhere.
  void useJournal(const std::string& socket) {
    agentLog.setLogFacility(nullptr);
    mirroring =
        std::make_unique<MirroringLogFacility>(files, JournalMirror::Host{loop, loop, agentLog}, socket);
    agentLog.setLogFacility(mirroring.get());
  }
  void record(const std::string& line) { mirroring->record({6, "Set", "Set", false, line, 0}); }
  /// One turn of the loop with so many records, named by their numbers.
  void burst(int count) {
    for (int i = 0; i < count; ++i) record(std::to_string(++_last));
    loop.drain();
  }
  void wait(std::chrono::nanoseconds time) {
    // In steps, as a loop would sleep: sending is what it does before.
    for (; time > time.zero(); time -= std::chrono::milliseconds(10)) {
      loop.advance(std::chrono::milliseconds(10));
      loop.drain();
    }
  }
  /// How many records the files have.
  [[nodiscard]] std::size_t kept() const { return countRecords(readFile(root + "/Set/Set.log")); }
  /// What the agent has said, without times.
  [[nodiscard]] std::string said() const { return readFile(directory / "stderr"); }
  static std::string missedLine(int count) { return "zalloggingagent: warning: " + missedText(count) + "\n"; }
  static std::string missedText(int count) {
    return "records in their files but not in the journal: " + std::to_string(count);
  }
  std::unique_ptr<ListeningJournal> listen() { return std::make_unique<ListeningJournal>(path); }

  TemporaryDirectory directory;
  const std::string root = directory / "Logs";
  const std::string path = directory / "journal";
  const Descriptor errors{::open((directory / "stderr").c_str(), O_CREAT | O_WRONLY | O_APPEND, 0600)};
  ManualRunLoop loop;
  ManualWorkQueues queues{loop};
  LinuxAgentLog agentLog{loop, {{}, false, errors.get()}};
  FileLogFacility files{{loop, loop, queues, agentLog}, root, LogSettings()};
  std::unique_ptr<MirroringLogFacility> mirroring;

 private:
  int _last = 0;
};

}  // namespace zal::testing
