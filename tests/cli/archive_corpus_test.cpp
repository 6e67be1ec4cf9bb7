#include <filesystem>

#include <gtest/gtest.h>

#include "fuzz/archive_fuzzer.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

/// A broken promise ends the process, after the name of the input was printed.
TEST(ArchiveCorpusTest, EveryArchiveKeepsItsPromises) {
  int inputs = 0;
  for (const auto& file : std::filesystem::directory_iterator(ZAL_FUZZ_CORPUS "/archive_fuzzer")) {
    SCOPED_TRACE(file.path().string());
    const std::string bytes = testing::readFile(file.path().string());
    fuzzArchive(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    ++inputs;
  }
  EXPECT_GE(inputs, 15);
}

}  // namespace
}  // namespace zal
