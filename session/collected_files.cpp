#include "session/collected_files.h"

#include <algorithm>
#include <filesystem>

#include "collectors/file_collector.h"
#include "platform/agent_log.h"

namespace zal {

namespace {

bool isControl(char character) {
  const auto byte = static_cast<unsigned char>(character);
  return byte < 0x20 || byte == 0x7F;
}

}  // namespace

bool hasControlCharacters(std::string_view text) { return std::any_of(text.begin(), text.end(), isControl); }

std::string printable(std::string_view text) {
  std::string shown(text);
  std::replace_if(shown.begin(), shown.end(), isControl, '?');
  return shown;
}

std::optional<std::string> containedCategory(std::string_view category) {
  const std::filesystem::path path(category);
  if (path.is_absolute() || hasControlCharacters(category)) return std::nullopt;
  const std::filesystem::path normal = path.lexically_normal();
  if (normal.empty() || normal == ".") return std::string();
  if (*normal.begin() == "..") return std::nullopt;
  return normal.string();
}

std::string fileSetText(const std::set<std::string>& files) {
  std::string text;
  for (const std::string& file : files) text.append(text.empty() ? "{" : ", ").append(file);
  return text.empty() ? "{}" : text + "}";
}

void placeCollectedFiles(const FilesByCategory& files, const std::string& directory, FileCollector& collector,
                         AgentLog& log) {
  for (const auto& [category, paths] : files) {
    const auto contained = containedCategory(category);
    if (!contained) {
      log.warning("Refused the file category \"" + printable(category) +
                  "\": it leads out of the session directory");
      continue;
    }
    const std::string destination = directory + "/" + *contained;
    log.notice("category:" + destination + " files=" + fileSetText(paths));
    if (const std::error_code error = collector.MakeDirectory(destination)) {
      log.warning("No files are moved into " + destination + ": " + error.message());
      continue;
    }
    for (const std::string& path : paths) collector.MoveFileIntoDirectory(path, destination, "");
  }
}

}  // namespace zal
