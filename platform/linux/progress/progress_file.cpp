#include "platform/linux/progress/progress_file.h"

#include <algorithm>
#include <filesystem>
#include <utility>

#include "platform/linux/config/text_file.h"

namespace zal {

std::string progressDirectory(const std::string& runtimeRoot) { return runtimeRoot + "/dumps"; }

std::vector<std::string> dumpProgressNames(const std::string& directory) {
  std::vector<std::string> names;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    std::string name = entry->path().filename().string();
    if (name.ends_with(".progress") && !name.starts_with('.')) names.push_back(std::move(name));
  }
  std::sort(names.begin(), names.end());
  return names;
}

std::optional<DumpProgressRecord> readDumpProgress(const std::string& directory, const std::string& name) {
  std::string text;
  if (readTextFile(directory + "/" + name, text)) return std::nullopt;
  auto record = parseDumpProgress(text);
  using State = DumpProgressRecord::State;
  if (record && record->state == State::running && !record->agent.isRunning()) {
    record->state = State::cutOff;
  }
  return record;
}

std::vector<ListedDumpProgress> listDumpProgress(const std::string& directory) {
  std::vector<ListedDumpProgress> records;
  for (std::string& name : dumpProgressNames(directory)) {
    if (auto record = readDumpProgress(directory, name)) {
      records.push_back({std::move(name), std::move(*record)});
    }
  }
  return records;
}

}  // namespace zal
