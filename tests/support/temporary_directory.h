#pragma once

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

namespace zal::testing {

/// A fresh directory below the system's temporary one, removed with all its content at the end.
class TemporaryDirectory {
 public:
  TemporaryDirectory();
  ~TemporaryDirectory();
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

  [[nodiscard]] const std::string& path() const { return _path; }
  [[nodiscard]] std::string operator/(const std::string& name) const { return _path + "/" + name; }

 private:
  std::string _path;
};

/// Makes missing parents and writes the file whole.
void writeFile(const std::string& path, const std::string& content);
/// The whole file; empty when there is none.
std::string readFile(const std::string& path);
/// Relative paths of everything below, sorted, one per line; directories end with a slash.
std::string listTree(const std::string& directory);

}  // namespace zal::testing
