#include "dump/dump_texts.h"

#include <cerrno>
#include <cstdio>
#include <system_error>

#include "platform/agent_log.h"
#include "platform/file_placement.h"

namespace zal {
namespace {

std::error_code writeFresh(FilePlacement& files, const std::string& path, std::string_view text) {
  const auto failure = [] { return std::error_code(errno != 0 ? errno : EIO, std::generic_category()); };
  std::FILE* const file = files.openFresh(path);
  if (file == nullptr) return failure();
  std::error_code error;
  if (std::fwrite(text.data(), 1, text.size(), file) != text.size()) error = failure();
  if (std::fclose(file) != 0 && !error) error = failure();
  return error;
}

}  // namespace

std::string deviceInfoText(std::string_view deviceName, std::string_view deviceDescription) {
  std::string text;
  if (!deviceName.empty()) text.append("Name: ").append(deviceName).append("   ");
  if (!deviceDescription.empty()) text.append("Device: ").append(deviceDescription).append("   ");
  return text;
}

void writeWholeFile(FilePlacement& files, AgentLog& log, const std::string& path, std::string_view text) {
  const std::string unfinished = path + ".unfinished";
  std::error_code error = writeFresh(files, unfinished, text);
  if (!error) error = files.replace(unfinished, path);
  if (!error) return;
  log.warning("Could not write " + path + ": " + error.message());
  files.remove(unfinished);
}

}  // namespace zal
