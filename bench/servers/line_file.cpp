#include "bench/servers/line_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <utility>
#include <vector>

namespace zal::bench {

LineFile::~LineFile() {
  if (_descriptor >= 0) close(_descriptor);
}

void LineFile::watch(std::filesystem::path path) { _path = std::move(path); }

std::uint64_t LineFile::_size() {
  if (_descriptor < 0) _descriptor = open(_path.c_str(), O_RDONLY | O_CLOEXEC);
  struct stat status {};
  if (_descriptor < 0 || fstat(_descriptor, &status) != 0) return 0;
  return static_cast<std::uint64_t>(status.st_size);
}

bool LineFile::learnLineLength() {
  _lineLength = _size();
  return _lineLength > 0;
}

std::uint64_t LineFile::lines() { return _lineLength == 0 ? 0 : _size() / _lineLength; }

std::uint64_t LineFile::linesByReading() const {
  std::ifstream file(_path, std::ios::binary);
  std::vector<char> block(1U << 20U);
  std::uint64_t count = 0;
  while (file.read(block.data(), static_cast<std::streamsize>(block.size())) || file.gcount() > 0) {
    count += static_cast<std::uint64_t>(std::count(block.begin(), block.begin() + file.gcount(), '\n'));
  }
  return count;
}

}  // namespace zal::bench
