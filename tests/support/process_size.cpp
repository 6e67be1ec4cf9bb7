#include "tests/support/process_size.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

std::uint64_t entriesOf(const std::string& directory) {
  std::error_code error;
  return static_cast<std::uint64_t>(std::distance(fs::directory_iterator(directory, error), {}));
}

}  // namespace

ProcessSize ProcessSize::of(pid_t process) {
  const std::string proc = "/proc/" + std::to_string(process);
  ProcessSize size{0, entriesOf(proc + "/fd"), entriesOf(proc + "/task")};
  std::ifstream status(proc + "/status");
  for (std::string word; status >> word;) {
    if (word == "VmRSS:") status >> size.residentKilobytes;
  }
  return size;
}

std::ostream& operator<<(std::ostream& out, const ProcessSize& size) {
  return out << size.residentKilobytes << " KiB, " << size.descriptors << " descriptors, " << size.threads
             << " threads";
}

std::uint64_t filesBelow(const std::string& directory) {
  std::error_code error;
  std::uint64_t files = 0;
  for (const auto& entry : fs::recursive_directory_iterator(directory, error))
    files += entry.is_regular_file();
  return files;
}

int soakLength(const char* variable, int everyday) {
  const char* const value = std::getenv(variable);
  return value != nullptr ? std::max(std::atoi(value), 2) : everyday;
}

}  // namespace zal::testing
