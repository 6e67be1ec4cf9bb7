#include "platform/linux/stackshot/report_place.h"

#include <unistd.h>

#include <filesystem>

#include "platform/linux/files/whole_file.h"
#include "platform/linux/stackshot/report_names.h"

namespace zal::stackshot {
namespace {

constexpr int kMostVariants = 100;

}  // namespace

PlacedReport placeReport(const std::string& place, const std::string& name, std::string_view text) {
  if (place == "-") return {"", writeWhole(STDOUT_FILENO, text)};
  std::error_code ignored;
  if (place.ends_with('/')) std::filesystem::create_directories(place, ignored);
  if (!place.ends_with('/') && !std::filesystem::is_directory(place, ignored)) {
    const bool hasFolder = place.find('/') != std::string::npos;
    return {place, placeWholeFile(hasFolder ? place : "./" + place, text, ExistingFile::isReplaced)};
  }
  PlacedReport result;
  for (int variant = 1; variant <= kMostVariants; ++variant) {
    result.path =
        place + (place.ends_with('/') ? "" : "/") + (variant == 1 ? name : variantOf(name, variant));
    result.error = placeWholeFile(result.path, text, ExistingFile::stays);
    if (result.error != std::errc::file_exists) break;
  }
  return result;
}

}  // namespace zal::stackshot
