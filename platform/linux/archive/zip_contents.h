#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace zal {

/// A regular file in a zip archive.
struct ZipEntry {
  std::string name;
  std::uint64_t bytes = 0;
};

/// The regular files of an archive, in its order; nothing when it cannot be read, or is none as ZipDirectory
/// takes them. Any thread.
[[nodiscard]] std::optional<std::vector<ZipEntry>> listZip(const std::string& archive);

/// One file out of an archive, whole and with its checksum right; nothing otherwise, or when it is
/// larger than 1 GiB. Any thread.
[[nodiscard]] std::optional<std::string> readZipEntry(const std::string& archive, const std::string& name);

}  // namespace zal
