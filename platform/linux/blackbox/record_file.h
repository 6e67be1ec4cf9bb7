#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/linux/files/descriptor.h"
#include "platform/session_records.h"

namespace zal {

/// Its number in the name, the seed of its checksums, tells a file of records from every other.
inline constexpr std::string_view kRecordFileEnding = ".session";
[[nodiscard]] std::uint32_t recordSeed(std::string_view fileName);

/// One record as a file of its own in a private directory, locked for as long as its process lives. Made
/// when the first piece is written. Ahead of what is written there is always room that was reserved while
/// there was some. While the disk refuses, a mebibyte waits in memory for it. Main thread only, but
/// for the removal.
class RecordFile final : public SessionRecord {
 public:
  /// With `syncs`, sync() and the removal wait for the medium.
  RecordFile(AgentLog& log, std::string directory, bool syncs);
  /// What is pending is still written.
  ~RecordFile() override;
  RecordFile(const RecordFile&) = delete;
  RecordFile& operator=(const RecordFile&) = delete;

  void append(std::string_view piece) override;
  [[nodiscard]] std::function<void()> removal(const std::string& writtenInto) override;

  /// Hands the pieces to the kernel.
  void write();
  /// Brings what was written on to the medium, when that is wanted. A medium that refuses is told in the
  /// log, once until it takes it, and tried again by the next call.
  void sync();

 private:
  [[nodiscard]] bool _open();
  void _reserve(std::size_t more);
  void _refuse(int error);

  AgentLog& _log;
  const std::string _directory;
  const std::string _path;
  const std::uint32_t _seed;
  const bool _syncs;
  Descriptor _file;
  std::string _pending;
  std::uint64_t _written = 0, _reserved = 0, _synced = 0;
  bool _refused = false;
  bool _isUnsyncedTold = false;
  bool _removed = false;
};

}  // namespace zal
