#include "platform/linux/process/procfs_process_table.h"

#include <unistd.h>

#include <algorithm>
#include <charconv>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <utility>

#include "platform/linux/files/readable_text.h"

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

/// The arguments, joined by blanks; nothing for a process that is gone or has none.
std::string commandOf(const std::string& folder) {
  std::string arguments = readableText(folder + "/cmdline");
  while (!arguments.empty() && arguments.back() == '\0') arguments.pop_back();
  std::replace(arguments.begin(), arguments.end(), '\0', ' ');
  if (arguments.empty()) {
    std::ifstream name(folder + "/comm");
    std::getline(name, arguments);
  }
  return arguments;
}

/// The file below the directory that standard output or error go to.
std::optional<std::string> outputBelow(const std::string& folder, const std::string& directory) {
  for (const char* const descriptor : {"/fd/1", "/fd/2"}) {
    std::error_code error;
    std::string target = std::filesystem::read_symlink(folder + descriptor, error).string();
    if (!error && target.starts_with(directory + "/")) return target;
  }
  return std::nullopt;
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

std::vector<FileWriter> ProcfsProcessTable::writersBelow(const std::string& directory) const {
  std::vector<FileWriter> writers;
  const auto table = processes();
  if (!table) return writers;
  for (const ProcessEntry& process : *table) {
    if (process.processId == ::getpid()) continue;
    const std::string folder = _root + "/" + std::to_string(process.processId);
    if (auto file = outputBelow(folder, directory)) {
      writers.push_back({process.processId, commandOf(folder), std::move(*file)});
    }
  }
  std::sort(writers.begin(), writers.end(),
            [](const FileWriter& a, const FileWriter& b) { return a.processId < b.processId; });
  return writers;
}

}  // namespace zal
