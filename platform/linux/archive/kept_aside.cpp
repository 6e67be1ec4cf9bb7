#include "platform/linux/archive/kept_aside.h"

#include <algorithm>
#include <climits>
#include <filesystem>

#include "platform/linux/files/rename_no_replace.h"

namespace zal {
namespace {

constexpr int kMostNames = 10'000;

/// At most that many bytes of it, whole characters.
std::string cutText(std::string text, std::size_t size) {
  if (text.size() <= size) return text;
  while (size > 0 && (static_cast<unsigned char>(text[size]) & 0xC0U) == 0x80) --size;
  text.resize(size);
  return text;
}

}  // namespace

std::string keepAside(const std::string& path, std::error_code& error, const RootedPaths& paths) {
  const RootedPlace here = paths.placeOf(path);
  error = here.error;
  if (error) return {};
  for (int number = 1; number <= kMostNames; ++number) {
    const std::string ending =
        " (not archived)" + (number > 1 ? '-' + std::to_string(number) : std::string());
    const std::string aside = cutText(here.name, NAME_MAX - ending.size()) + ending;
    error = renameNoReplaceAt(here.directory.get(), here.name, here.directory.get(), aside);
    if (!error) return (std::filesystem::path(path).parent_path() / aside).string();
    if (error != std::errc::file_exists && error != std::errc::directory_not_empty) return {};
  }
  return {};
}

}  // namespace zal
