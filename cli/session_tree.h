#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// A file of a session, by its path below the session's directory.
struct SessionFile {
  std::string path;
  std::uint64_t bytes = 0;
};

/// One session that was written out: what its directory's name says, and what lies in it.
struct SessionDirectory {
  std::string type;
  std::string started;  ///< "2024-05-02 14:03:07"
  std::string zone;     ///< "CEST"
  std::string role;     ///< "Initiator" or "Receiver"
  std::string path;
  std::vector<SessionFile> files;  ///< by path

  [[nodiscard]] std::uint64_t bytes() const;
};

/// From "2024-05-02 at 14-03-07 (CEST) (Initiator)"; nothing when the name is another's.
[[nodiscard]] std::optional<SessionDirectory> parseSessionName(std::string_view name);

/// The session whose directory this is; nothing when there is no such directory. A name that says
/// nothing leaves those fields empty.
[[nodiscard]] std::optional<SessionDirectory> readSession(const std::string& path);

/// All sessions below `root`/TYPE, the latest first. What cannot be read is left out.
[[nodiscard]] std::vector<SessionDirectory> findSessions(const std::string& root);

}  // namespace zal
