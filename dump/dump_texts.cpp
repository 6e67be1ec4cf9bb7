#include "dump/dump_texts.h"

#include <filesystem>
#include <fstream>
#include <system_error>

namespace zal {

std::string deviceInfoText(std::string_view deviceName, std::string_view deviceDescription) {
  std::string text;
  if (!deviceName.empty()) text.append("Name: ").append(deviceName).append("   ");
  if (!deviceDescription.empty()) text.append("Device: ").append(deviceDescription).append("   ");
  return text;
}

void writeWholeFile(const std::string& path, std::string_view text) {
  const std::string unfinished = path + ".unfinished";
  std::ofstream file(unfinished, std::ios::binary | std::ios::trunc);
  if (!file) return;
  file.write(text.data(), static_cast<std::streamsize>(text.size()));
  file.close();
  std::error_code error = file ? std::error_code{} : std::make_error_code(std::errc::io_error);
  if (!error) std::filesystem::rename(unfinished, path, error);
  if (error) std::filesystem::remove(unfinished, error);
}

}  // namespace zal
