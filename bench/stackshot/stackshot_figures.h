#pragma once

#include <filesystem>
#include <string>

namespace zal::bench {

/// The stacks of a small machine: processes and threads that all sleep, among process ids of their own.
struct StackshotFigures {
  std::string missing;      ///< why there are no figures; empty when there are
  std::string peerMissing;  ///< why there are none of the peer's
  double ours = 0;          ///< seconds, median
  double peer = 0;          ///< seconds, median
};

/// Takes the stackshot and, in the same rounds, runs `eu-stack` once for each of the processes.
[[nodiscard]] StackshotFigures measureStackshot(const std::filesystem::path& programs, unsigned processes,
                                                unsigned threadsEach, unsigned rounds);

}  // namespace zal::bench
