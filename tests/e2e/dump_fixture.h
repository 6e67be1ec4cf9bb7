#pragma once

#include <optional>
#include <string>
#include <vector>

#include "client/lirra.hpp"
#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/progress/progress_file.h"
#include "tests/e2e/e2e_fixture.h"

namespace zal::testing {

/// A daemon that takes dumps: its closing stages follow each other at once. While the marker of a modem that
/// is still writing lies there, a collection with baseband logs waits before its second stage.
class DumpFixture : public E2eFixture {
 protected:
  static constexpr int kNoPromptNoAlert = 4;
  static constexpr int kReplyLimit = 120'000;  ///< milliseconds

  DumpFixture() { sandbox.settings = "[testing]\nclosingStageDelay = 0.1\n"; }

  [[nodiscard]] lirra::Client makeClient() const {
    return lirra::Client({.socketPath = sandbox.socketPath(), .sender = "caller"});
  }
  /// Asks for a dump without questions; the ticket of its reply.
  static std::uint64_t ask(lirra::Client& client, const std::string& type, std::int64_t flags,
                           std::int64_t displayFlags = kNoPromptNoAlert) {
    lirra::Dictionary info;
    info.setInt64("collectionFlags", flags).setInt64("displayFlags", displayFlags);
    std::uint64_t ticket = 0;
    EXPECT_EQ(client.ask(type, 14, info, ticket), LIRRA_OK);
    return ticket;
  }
  /// The archive that the reply names; empty when none came.
  static std::string archiveOf(lirra::Client& client, std::uint64_t ticket) {
    lirra::Dictionary reply;
    if (client.awaitReply(ticket, kReplyLimit, reply) != LIRRA_OK) return "";
    const lirra_dictionary* result = nullptr;
    const char* path = nullptr;
    if (lirra_dictionary_dictionary(reply.raw(), "replyResult", &result) != LIRRA_OK) return "";
    return lirra_dictionary_string(result, "logPath", &path) == LIRRA_OK ? path : "";
  }

  [[nodiscard]] std::string marker() const { return sandbox / "tmp/Telvane.dumping"; }
  void holdSecondStage() const { writeFile(marker(), ""); }
  void releaseSecondStage() const { std::filesystem::remove(marker()); }

  /// What a shell command prints.
  static std::string outputOf(const std::string& command);
  /// Names in the archive, sorted, without those of directories; empty when unzip finds it damaged.
  static std::vector<std::string> entriesOf(const std::string& archive);
  static std::string textIn(const std::string& archive, const std::string& entry);

  /// The progress records, the oldest first.
  [[nodiscard]] std::vector<ListedDumpProgress> records() const {
    return listDumpProgress(progressDirectory(sandbox / "runtime"));
  }
  [[nodiscard]] std::vector<AlertRecord> alerts() const {
    return listAlerts(alertDirectory(sandbox / "runtime"));
  }
  /// Paths below the report root, files and directories, that end so.
  [[nodiscard]] std::vector<std::string> reportsEndingWith(const std::string& ending) const;
};

}  // namespace zal::testing
