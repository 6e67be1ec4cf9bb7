#pragma once

#include <cstdint>
#include <filesystem>

namespace zal::bench {

/// What was made, so that a reader of the figures knows what they are about.
struct DumpDirectory {
  std::uint64_t files = 0;
  std::uint64_t bytes = 0;
};

/// Fills a directory that does not exist yet with about that many bytes, as a dump leaves them: logs of
/// several kinds and lengths (some three fifths), captures of network traffic (a fifth), files that are
/// compressed already (a seventh), tables and property lists. The same bytes for the same size, always.
[[nodiscard]] DumpDirectory makeDumpDirectory(const std::filesystem::path& directory, std::uint64_t bytes);

}  // namespace zal::bench
