#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "platform/linux/config/file_signature.h"
#include "platform/main_thread_check.h"
#include "platform/preference_store.h"

namespace zal {

/// Preferences in one TOML file per domain, `<directory>/<domain>.toml`, with switches at the top
/// level. A missing file has no keys; one that cannot be read or parsed has none either and costs
/// one warning with its line for each change of the file.
class TomlPreferenceStore : public PreferenceStore {
 public:
  TomlPreferenceStore(std::string directory, AgentLog& log) : _directory(std::move(directory)), _log(log) {}

  void synchronize(std::string_view domain) override;
  [[nodiscard]] std::optional<bool> boolean(std::string_view domain, std::string_view key) override;

  [[nodiscard]] static std::string filePath(const std::string& directory, std::string_view domain);
  /// Stores one switch, making file and directory where missing; all other text of the file stays.
  /// Readers see the old file or the new one, never a part. Any thread. Returned: why it was not
  /// stored, in one sentence, or nothing on success.
  [[nodiscard]] static std::optional<std::string> setBoolean(const std::string& directory,
                                                             std::string_view domain, std::string_view key,
                                                             bool value);

 private:
  struct Domain {
    FileSignature signature;
    std::error_code trouble;  ///< why it could not be read the last time
    std::map<std::string, bool, std::less<>> switches;
  };
  Domain& _synchronized(std::string_view domain);

  std::string _directory;
  AgentLog& _log;
  std::map<std::string, Domain, std::less<>> _domains;
  MainThreadCheck _mainThread;
};

}  // namespace zal
