#include "tests/support/temporary_directory.h"

#include <unistd.h>

#include <cstdlib>
#include <set>
#include <stdexcept>

namespace zal::testing {

TemporaryDirectory::TemporaryDirectory() {
  std::string pattern = (std::filesystem::temp_directory_path() / "zal-XXXXXX").string();
  if (::mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary directory: " + pattern);
  _path = pattern;
}

TemporaryDirectory::~TemporaryDirectory() {
  std::error_code ignored;
  std::filesystem::remove_all(_path, ignored);
}

void writeFile(const std::string& path, const std::string& content) {
  std::filesystem::create_directories(std::filesystem::path(path).parent_path());
  std::ofstream(path, std::ios::binary) << content;
}

std::string readFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

std::string listTree(const std::string& directory) {
  std::set<std::string> names;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(directory)) {
    std::string name = entry.path().lexically_relative(directory).string();
    if (entry.is_directory() && !entry.is_symlink()) name += '/';
    names.insert(name);
  }
  std::string text;
  for (const auto& name : names) text += name + '\n';
  return text;
}

}  // namespace zal::testing
