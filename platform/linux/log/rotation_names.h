#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

// The files of one log file's rotation, X being "<set>.log" or "<set>-Event.log":
//
//   X.pending-7     full, not yet compressed
//   X.zip.tmp       being compressed; worthless after a crash
//   X.ready-7.zip   compressed and on the disk: from now on the pending file is superfluous
//   X.1.zip         newest generation, up to X.9.zip

inline constexpr int kGenerations = 9;

[[nodiscard]] std::string pendingName(std::string_view fileName, std::uint64_t sequence);
[[nodiscard]] std::string readyName(std::string_view fileName, std::uint64_t sequence);
[[nodiscard]] std::string generationName(std::string_view fileName, int generation);
[[nodiscard]] std::string unfinishedZipName(std::string_view fileName);

/// What a directory entry's name says about an unfinished rotation.
struct RotationLeftover {
  enum class Kind { pending, unfinishedZip, ready };
  Kind kind;
  std::string fileName;        ///< X
  std::uint64_t sequence = 0;  ///< 0 for an unfinished zip
};
/// Nothing for all other names.
[[nodiscard]] std::optional<RotationLeftover> parseRotationLeftover(std::string_view entryName);

}  // namespace zal
