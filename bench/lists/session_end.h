#pragma once

#include <filesystem>
#include <vector>

namespace zal::bench {

struct SessionEndSeconds {
  double end = 0;         ///< of ending a session with that many verbose lines, all its files written
  double plainWrite = 0;  ///< of writing the bytes of those files from memory to one other file
};

/// A session with one verbose line a time, in the order given (seconds since 1970). It is a real one on a
/// clock of its own; its files go below the folder.
[[nodiscard]] SessionEndSeconds measureSessionEnd(const std::filesystem::path& folder,
                                                  const std::vector<double>& times);

}  // namespace zal::bench
