#include "platform/linux/process/procfs_process_table.h"

#include <charconv>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <utility>

namespace zal {

namespace {

// The kernel keeps 16 bytes with the terminator; some of its own threads show a longer text.
constexpr std::size_t kLongestShortName = 15;

std::optional<pid_t> processId(const std::string& name) {
  pid_t id = 0;
  const auto [end, error] = std::from_chars(name.data(), name.data() + name.size(), id);
  if (error != std::errc{} || end != name.data() + name.size() || id < 1) return std::nullopt;
  return id;
}

}  // namespace

ProcfsProcessTable::ProcfsProcessTable(std::string root) : _root(std::move(root)) {}

std::optional<std::vector<ProcessEntry>> ProcfsProcessTable::processes() const {
  std::error_code error;
  std::filesystem::directory_iterator entry(_root, error);
  if (error) return std::nullopt;
  std::vector<ProcessEntry> table;
  while (entry != std::filesystem::directory_iterator()) {
    const std::string folder = entry->path().filename().string();
    entry.increment(error);
    if (error) return std::nullopt;
    const auto id = processId(folder);
    if (!id) continue;
    std::ifstream file(_root + "/" + folder + "/comm");
    std::string name;
    if (!std::getline(file, name)) continue;
    table.push_back({*id, name.substr(0, kLongestShortName)});
  }
  return table;
}

}  // namespace zal
