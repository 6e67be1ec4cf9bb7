#include "session/reference_time.h"

#include <filesystem>
#include <fstream>
#include <system_error>

#include "collectors/command_runner.h"
#include "session/text_encoding.h"

namespace zal {

namespace {

constexpr const char* kCommand = "/usr/local/bin/horvand getReferenceTime";
constexpr const char* kFileName = "time-file.txt";
// The directory is open to everybody, and the text becomes a line of three files.
constexpr std::size_t kLargestText = 64U * 1024U;

std::optional<std::string> readText(const std::string& path) {
  std::error_code error;
  if (!std::filesystem::is_regular_file(std::filesystem::symlink_status(path, error))) return std::nullopt;
  std::ifstream file(path, std::ios::binary);
  if (!file) return std::nullopt;
  std::string text(kLargestText + 1, '\0');
  file.read(text.data(), static_cast<std::streamsize>(text.size()));
  text.resize(static_cast<std::size_t>(file.gcount()));
  if (file.bad() || text.size() > kLargestText || !isValidUtf8(text)) return std::nullopt;
  return text;
}

}  // namespace

std::optional<std::string> referenceTime(CommandRunner& commands, const std::string& directory) {
  // What lies there instead is not the tool's answer.
  if (!commands.RunCommandAndWait(kCommand, directory, kFileName)) return std::nullopt;
  const std::string path = directory + "/" + kFileName;
  std::error_code error;
  if (!std::filesystem::exists(path, error)) return "Unknown reference time!";
  const auto text = readText(path);
  if (!text) return std::nullopt;
  return std::string(trimmed(*text));
}

}  // namespace zal
