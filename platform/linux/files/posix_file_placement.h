#pragma once

#include <string>
#include <vector>

#include "platform/file_placement.h"
#include "platform/linux/files/rooted_paths.h"
#include "platform/linux/files/temporary_area.h"

namespace zal {

/// Places files with the kernel's own means. Any thread.
///
/// What is written lies below one of the roots, and no symbolic link on the way to it from there is followed:
/// that is an error, too_many_symbolic_link_levels. Sources may lie anywhere.
///
/// What a directory copy cannot take along, it leaves out and reports the first reason; pipes,
/// sockets and devices are left out without an error. A move across file systems takes all or
/// nothing: it copies into the temporary area, or under a hidden name beside the target (".zal-" and 32 hex
/// digits) where that area is on another file system than the target, syncs, renames, and only then removes
/// the source. If that removal fails, both are there and the error says why.
class PosixFilePlacement : public FilePlacement {
 public:
  /// The temporary area need not exist: it is made, for this user alone, when first needed.
  /// Roots as RootedPaths takes them; without any, links on the way are followed.
  PosixFilePlacement(std::string homeDirectory, std::string temporaryArea,
                     const std::vector<std::string>& roots = {});

  [[nodiscard]] std::string homeDirectory() const override { return _home; }
  /// In TemporaryArea::path().
  [[nodiscard]] std::string randomTemporaryPath(std::string_view suffix) override;
  /// Tries 10,000 names.
  [[nodiscard]] std::optional<std::string> uniqueSavePath(const std::string& path) override;
  std::error_code link(const std::string& source, const std::string& target) override;
  std::error_code rename(const std::string& source, const std::string& target) override;
  std::error_code move(const std::string& source, const std::string& target) override;
  std::error_code prepareOutput(const std::string& path) override;
  std::error_code copy(const std::string& source, const std::string& target) override;
  std::error_code makeDirectories(const std::string& path) override;
  [[nodiscard]] std::FILE* openFresh(const std::string& path) override;
  std::error_code replace(const std::string& source, const std::string& target) override;
  std::error_code linkSymbolically(const std::string& text, const std::string& path) override;
  std::error_code remove(const std::string& path) override;

 private:
  std::error_code _copyIntoPlace(const std::string& source, const RootedPlace& target);

  const std::string _home;
  const std::string _temporaryParent;
  TemporaryArea _temporaryArea;
  const RootedPaths _paths;
};

}  // namespace zal
