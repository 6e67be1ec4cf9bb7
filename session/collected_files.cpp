#include "session/collected_files.h"

#include <algorithm>
#include <filesystem>
#include <utility>

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

CollectedFilesMove::CollectedFilesMove(FilesByCategory files, std::string directory, FileCollector& collector,
                                       AgentLog& log)
    : _left(std::move(files)), _directory(std::move(directory)), _collector(collector), _log(log) {}

void CollectedFilesMove::_beginCategory() {
  const auto& [category, paths] = *_left.begin();
  _hasBegun = true;
  _destination.reset();
  const auto contained = containedCategory(category);
  if (!contained) {
    _log.warning("Refused the file category \"" + printable(category) +
                 "\": it leads out of the session directory");
    return;
  }
  const std::string destination = _directory + "/" + *contained;
  _log.notice("category:" + destination + " files=" + fileSetText(paths));
  if (const std::error_code error = _collector.makeDirectory(destination)) {
    _log.warning("No files are moved into " + destination + ": " + error.message());
    return;
  }
  _destination = destination;
}

template <class Mover>
bool CollectedFilesMove::_go(const Mover& isMoved) {
  while (!_left.empty()) {
    if (!_hasBegun) _beginCategory();
    std::set<std::string>& paths = _left.begin()->second;
    while (_destination && !paths.empty()) {
      if (!isMoved(*paths.begin())) return false;
      paths.erase(paths.begin());
    }
    _left.erase(_left.begin());
    _hasBegun = false;
  }
  return true;
}

bool CollectedFilesMove::moveWithinFileSystem() {
  return _go([this](const std::string& path) {
    return _collector.MoveFileWithinFileSystem(path, *_destination, "").has_value();
  });
}

void CollectedFilesMove::moveRest() {
  _go([this](const std::string& path) {
    _collector.MoveFileIntoDirectory(path, *_destination, "");
    return true;
  });
}

}  // namespace zal
