#pragma once

#include <functional>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "tests/crash_points/played_client.h"
#include "tests/e2e/agent_sandbox.h"

namespace zal::testing {

/// What one client told an agent, and what it was told to be safe.
struct Told {
  std::set<int> entries, confirmedEntries;  ///< numbers of a session's descriptions
  std::set<int> records, confirmedRecords;  ///< numbers of log records
  std::set<std::string> confirmedHeaders;   ///< lines that have to be at the top of the session's logs
  bool endIsConfirmed = false;
  bool mayLackEnds = false;  ///< session logs need not be whole

  [[nodiscard]] std::size_t confirmed() const {
    return confirmedEntries.size() + confirmedRecords.size() + confirmedHeaders.size();
  }
};

class Aftermath;

/// What is played to an agent that may end at any moment.
class Scenario {
 public:
  virtual ~Scenario() = default;
  /// Before the agent starts: configuration, and the files that are to be collected.
  virtual void prepare(AgentSandbox& sandbox) const = 0;
  /// Until everything is done or the agent has ended.
  virtual void play(const AgentSandbox& sandbox, PlayedClient& client, Told& told) const = 0;
  /// What must be there once all agents have ended.
  virtual void check(Aftermath& after, const Told& told) const = 0;

  /// "call" or "dump"; nullptr for others.
  static std::unique_ptr<Scenario> named(const std::string& name);
};

[[nodiscard]] std::unique_ptr<Scenario> makeCallScenario();
[[nodiscard]] std::unique_ptr<Scenario> makeDumpScenario();

/// One log record with that number.
void tellRecord(PlayedClient& client, Told& told, int number);
/// Until the agent has made an archive or said why not, and has done what follows from that.
void waitForArchive(const AgentSandbox& sandbox, PlayedClient& client);

}  // namespace zal::testing
