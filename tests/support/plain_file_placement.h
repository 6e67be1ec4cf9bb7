#pragma once

#include <cstdio>
#include <filesystem>
#include <functional>
#include <string>
#include <utility>

#include "platform/file_placement.h"
#include "platform/open_directories.h"

namespace zal::testing {

/// Real files through the standard library; no copying across file systems. `failWith` makes link,
/// move and copy fail for the sources that it names an error for.
class PlainFilePlacement : public FilePlacement {
 public:
  ~PlainFilePlacement() override;
  explicit PlainFilePlacement(std::string home) : _home(std::move(home)) {}
  std::function<std::error_code(const std::string& source)> failWith;

  [[nodiscard]] std::string homeDirectory() const override { return _home; }
  [[nodiscard]] std::string randomTemporaryPath(std::string_view suffix) override {
    return _home + "/temporary-" + std::to_string(++_counter) + std::string(suffix);
  }
  [[nodiscard]] std::optional<std::string> uniqueSavePath(const std::string& path) override {
    const std::filesystem::path wanted(path);
    std::filesystem::path candidate = wanted;
    for (int number = 2; std::filesystem::exists(std::filesystem::symlink_status(candidate)); ++number) {
      candidate = wanted.parent_path() /
                  (wanted.stem().string() + "-" + std::to_string(number) + wanted.extension().string());
    }
    return candidate.string();
  }
  std::error_code link(const std::string& source, const std::string& target) override {
    std::error_code error = _injected(source);
    if (!error) std::filesystem::create_hard_link(source, target, error);
    return error;
  }
  /// Sources that lie on another file system: they can be moved, not renamed.
  std::function<bool(const std::string& source)> isElsewhere;
  std::error_code rename(const std::string& source, const std::string& target) override {
    if (isElsewhere && isElsewhere(source)) return std::make_error_code(std::errc::cross_device_link);
    return move(source, target);
  }
  std::error_code move(const std::string& source, const std::string& target) override {
    std::error_code error = _injected(source);
    if (!error && std::filesystem::exists(target)) error = std::make_error_code(std::errc::file_exists);
    if (!error) std::filesystem::rename(source, target, error);
    return error;
  }
  /// As where nobody else writes, unless a test says so of some paths.
  std::function<std::error_code(const std::string& path)> refuseOutput;
  std::error_code prepareOutput(const std::string& path) override {
    return refuseOutput ? refuseOutput(path) : std::error_code{};
  }
  std::error_code copy(const std::string& source, const std::string& target) override {
    std::error_code error = _injected(source);
    if (!error && std::filesystem::exists(target)) error = std::make_error_code(std::errc::file_exists);
    if (!error) {
      std::filesystem::copy(
          source, target,
          std::filesystem::copy_options::recursive | std::filesystem::copy_options::copy_symlinks, error);
    }
    return error;
  }
  std::error_code makeDirectories(const std::string& path) override {
    return createDirectoriesWithMode0777(path);
  }
  [[nodiscard]] std::FILE* openFresh(const std::string& path) override {
    std::error_code error;
    if (std::filesystem::is_character_file(path, error)) return std::fopen(path.c_str(), "wb");
    if (!std::filesystem::is_directory(path, error)) std::filesystem::remove(path, error);
    return std::fopen(path.c_str(), "wbx");
  }
  std::error_code replace(const std::string& source, const std::string& target) override {
    std::error_code error;
    std::filesystem::rename(source, target, error);
    return error;
  }
  std::error_code linkSymbolically(const std::string& text, const std::string& path) override {
    std::error_code error;
    std::filesystem::create_symlink(text, path, error);
    return error;
  }
  std::error_code remove(const std::string& path) override {
    std::error_code error;
    std::filesystem::remove_all(path, error);
    return error;
  }

 private:
  std::error_code _injected(const std::string& source) {
    return failWith ? failWith(source) : std::error_code{};
  }
  std::string _home;
  int _counter = 0;
};

}  // namespace zal::testing
