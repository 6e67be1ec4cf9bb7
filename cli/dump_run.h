#pragma once

#include <chrono>
#include <optional>
#include <set>
#include <string>

#include "cli/dump_display.h"
#include "cli/tool_context.h"
#include "client/lirra.hpp"

namespace zal {

/// What a request for a dump says, and how its prompt is answered.
struct DumpOrder {
  std::string session;
  lirra::Dictionary info;
  std::string promptTitle;                 ///< of the prompt that is ours to answer
  std::optional<std::string> description;  ///< what it is answered with; nothing: it is left alone
};

/// One dump from the request to the agent's reply, shown while it is made. Runs once.
class DumpRun {
 public:
  /// Where there is no --timeout: a full dump of a busy machine takes minutes, not more.
  static constexpr std::chrono::seconds kUsualLimit{600};

  DumpRun(ToolContext& tool, DumpOrder order);
  ExitCode run();

 private:
  using Time = std::chrono::steady_clock::time_point;
  /// Until the agent has taken the request or is at it. Returned: how it failed.
  lirra::Result _reachAgent(lirra::Client& client);
  /// Until the reply is there. Returned: the exit code, when it went wrong.
  std::optional<ExitCode> _awaitReply(lirra::Client& client, std::uint64_t ticket, lirra::Dictionary& reply);
  /// Returned: why there will be no dump.
  std::optional<std::string> _answerPrompt();
  void _look();
  ExitCode _failWithoutReply(const std::string& trouble);
  ExitCode _finish(const lirra::Dictionary& reply);
  [[nodiscard]] std::chrono::milliseconds _elapsed() const;

  ToolContext& _tool;
  DumpOrder _order;
  DumpDisplay _display;
  std::set<std::string> _earlierDumps;
  std::optional<DumpView> _dump;
  std::optional<Time> _cutOff;  ///< when its record was first seen to be
  bool _promptAnswered = false;
  Time _start;
  Time _deadline;
};

/// Whether the record is that of a dump for this session type, and of no other collection.
[[nodiscard]] bool isDumpOf(const DumpView& record, const std::string& session);

}  // namespace zal
