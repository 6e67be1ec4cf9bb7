#include "platform/linux/helper/device_core_dumps.h"

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <vector>

#include "platform/linux/files/directory_names.h"

namespace zal::helper {
namespace {

std::uint64_t sizeOf(const std::string& path) {
  std::error_code error;
  const auto size = std::filesystem::file_size(path, error);
  return error ? 0 : size;
}

}  // namespace

void copyDeviceCoreDumps(const std::string& root, DumpFiles& files, Patience& patience) {
  const std::string folder = root + "/sys/class/devcoredump";
  std::vector<std::string> sources;
  for (const std::string& name : namesIn(folder)) {
    std::error_code none;
    if (std::filesystem::exists(folder + "/" + name + "/data", none))
      sources.push_back(folder + "/" + name + "/data");
  }
  std::sort(sources.begin(), sources.end());
  if (sources.empty()) {
    files.missing("device core dumps", "there are none");
    return;
  }
  std::uint64_t left = kMostCoreBytes;
  int number = 1;
  for (const std::string& source : sources) {
    const std::string name = number == 1 ? "devcore.bin" : "devcore-" + std::to_string(number) + ".bin";
    if (left == 0) {
      files.missing(source, "no room left for more of them");
    } else if (files.copy(name, source, left, patience)) {
      // The copy is what counts: files made as they are read tell no size.
      left -= std::min(left, sizeOf(files.pathOf(name)));
      ++number;
    }
  }
}

}  // namespace zal::helper
