#pragma once

#include <optional>
#include <string>

#include "platform/agent_log.h"
#include "platform/linux/files/descriptor.h"

namespace zal {

/// A record file that an earlier process left. While it is looked at its name says how often that was
/// tried: one that takes the agent down with it must not do so at every start.
class LeftRecord {
 public:
  /// Nothing when the name is no record's, its process still lives, it is not an ordinary file, or it was
  /// tried often enough: that one is set aside and logged.
  [[nodiscard]] static std::optional<LeftRecord> take(const std::string& directory, const std::string& name,
                                                      AgentLog& log);

  [[nodiscard]] std::uint32_t seed() const;
  /// All of it; what the medium does not give back reads as zeros.
  [[nodiscard]] std::string content() const;
  void remove() const;
  /// The next start finds it as this one did.
  void putBack() const;

 private:
  LeftRecord(Descriptor file, std::string directory, std::string number);
  [[nodiscard]] std::string _pathOf(const std::string& ending) const;

  Descriptor _file;  ///< holds the lock
  std::string _directory;
  std::string _number;
  std::string _path;
};

}  // namespace zal
