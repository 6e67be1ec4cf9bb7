#pragma once

#include <cstdint>
#include <filesystem>

namespace zal::bench {

struct SessionEndSeconds {
  double end = 0;         ///< of ending a session with that many verbose lines, all its files written
  double plainWrite = 0;  ///< of writing the bytes of those files from memory to one other file
};

/// The session is a real one on a clock of its own; its files go below the folder.
[[nodiscard]] SessionEndSeconds measureSessionEnd(const std::filesystem::path& folder, std::uint64_t lines);

}  // namespace zal::bench
