#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/linux/files/descriptor.h"
#include "platform/session_records.h"

namespace zal {

/// A record file that an earlier process left. While it is looked at its name says how often that was
/// tried: one that takes the agent down with it must not do so at every start.
class LeftRecord final : public UnfinishedRecord {
 public:
  /// Nothing when the name is no record's, its process still lives, it is not an ordinary file, or it was
  /// tried often enough: that one is set aside and logged.
  [[nodiscard]] static std::optional<LeftRecord> take(const std::string& directory, const std::string& name,
                                                      AgentLog& log);

  /// Holds some MiB of it at a time, or the longest piece; what the medium does not give back reads as zeros.
  std::uint64_t read(const std::function<void(std::string_view piece)>& handler) const override;
  void remove() const;
  /// The next start finds it as this one did.
  void putBack() const;

 private:
  LeftRecord(Descriptor file, std::uint64_t size, std::string directory, std::string number);
  [[nodiscard]] std::string _pathOf(const std::string& ending) const;
  void _fill(std::uint64_t offset, char* buffer, std::size_t size) const;

  Descriptor _file;  ///< holds the lock
  std::uint64_t _size;
  std::string _directory;
  std::string _number;
  std::string _path;
};

}  // namespace zal
