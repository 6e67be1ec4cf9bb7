#include "bench/support/scratch_folder.h"

#include <stdlib.h>

#include <cstdio>

namespace zal::bench {
namespace {

constexpr std::uintmax_t kRoomWanted = 2ULL << 30U;

}  // namespace

std::filesystem::path ScratchFolder::parent() {
  std::error_code error;
  const auto memory = std::filesystem::space("/dev/shm", error);
  if (!error && memory.available >= kRoomWanted) return "/dev/shm";
  return std::filesystem::temp_directory_path();
}

ScratchFolder::ScratchFolder() {
  std::string name = (parent() / "zal-bench-XXXXXX").string();
  if (mkdtemp(name.data()) == nullptr) {
    perror(name.c_str());
    exit(1);
  }
  _path = name;
}

ScratchFolder::~ScratchFolder() {
  std::error_code error;
  std::filesystem::remove_all(_path, error);
}

}  // namespace zal::bench
