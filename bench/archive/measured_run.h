#pragma once

#include <filesystem>
#include <string>
#include <vector>

namespace zal::bench {

/// What one program took, from its start to its end, its children included.
struct RunFigures {
  double seconds = 0;
  double cpuSeconds = 0;
  double peakMebibytes = 0;  ///< resident
  bool succeeded = false;
};

/// Runs the program in the folder, its output thrown away. What earlier ones left to be written to the
/// disk is written before the clock starts.
[[nodiscard]] RunFigures measureRun(const std::vector<std::string>& command,
                                    const std::filesystem::path& folder);

}  // namespace zal::bench
