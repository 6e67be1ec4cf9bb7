#pragma once

#include <cstdint>
#include <filesystem>
#include <map>
#include <string>

namespace zal::bench {

/// What `list_bench` says, by name; empty when it fails. It runs apart so that its lists of a million
/// entries do not leave their traces in the memory of the other measurements.
[[nodiscard]] std::map<std::string, double> runListBench(const std::filesystem::path& programs,
                                                         std::uint64_t entries, unsigned rounds);

}  // namespace zal::bench
