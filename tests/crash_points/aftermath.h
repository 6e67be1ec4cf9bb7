#pragma once

#include <string>
#include <vector>

#include "tests/crash_points/scenario.h"
#include "tests/e2e/agent_sandbox.h"

namespace zal::testing {

/// What must hold once the agent that came after has ended.
class Aftermath {
 public:
  explicit Aftermath(const AgentSandbox& sandbox);

  /// Every confirmed entry once and in order; none twice; the header lines with them.
  void checkSession(const Told& told);
  /// Every confirmed log record once and in order.
  void checkLogSet(const Told& told);
  /// The file that was to be collected is there, whole, and in so many places at most.
  void checkGatheredFile(const std::string& path, int most);
  /// A file that is collected and stays: as it was, and in archives too if they have it.
  void checkSource(const std::string& path, const std::string& text);
  /// Every archive is as it was made, and has no directory beside it; the newest is linked.
  void checkArchives();
  /// Nothing of what only a running agent needs.
  void checkStrays();
  void fail(const std::string& what) { _violations.push_back(what); }

  [[nodiscard]] const std::vector<std::string>& violations() const { return _violations; }

 private:
  struct GatheredText {
    std::string place;
    std::string name;
    std::string text;
  };
  /// Of all collections, those in archives included.
  [[nodiscard]] std::vector<GatheredText> _gathered(const std::string& ofName) const;
  /// Whether it has the logs of a session that the next agent wrote, as the disk had refused them before.
  [[nodiscard]] static bool _isRecovered(const std::string& directory);
  void _checkNumbers(const std::string& text, const std::string& mark, const std::set<int>& told,
                     const std::set<int>& confirmed, const std::string& where);

  const AgentSandbox& _sandbox;
  std::vector<std::string> _directories;  ///< of collections, without their archives
  std::vector<std::string> _archives;
  std::vector<std::string> _violations;
};

}  // namespace zal::testing
