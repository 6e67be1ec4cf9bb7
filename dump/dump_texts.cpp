#include "dump/dump_texts.h"

#include <cstdio>
#include <filesystem>
#include <system_error>

#include "platform/fresh_file.h"

namespace zal {

std::string deviceInfoText(std::string_view deviceName, std::string_view deviceDescription) {
  std::string text;
  if (!deviceName.empty()) text.append("Name: ").append(deviceName).append("   ");
  if (!deviceDescription.empty()) text.append("Device: ").append(deviceDescription).append("   ");
  return text;
}

void writeWholeFile(const std::string& path, std::string_view text) {
  const std::string unfinished = path + ".unfinished";
  std::FILE* const file = openFreshFile(unfinished);
  if (file == nullptr) return;
  const bool isWhole = std::fwrite(text.data(), 1, text.size(), file) == text.size();
  const bool isClosed = std::fclose(file) == 0;
  std::error_code error;
  if (!isWhole || !isClosed) error = std::make_error_code(std::errc::io_error);
  if (!error) std::filesystem::rename(unfinished, path, error);
  if (error) std::filesystem::remove(unfinished, error);
}

}  // namespace zal
