#include <algorithm>
#include <filesystem>

#include <gtest/gtest.h>

#include "fuzz/fuzz_entries.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using Entry = void (*)(const std::uint8_t*, std::size_t);

/// A broken promise ends the process, after the name of the input was printed.
int runAll(const std::string& corpus, Entry entry) {
  int inputs = 0;
  for (const auto& file : std::filesystem::directory_iterator(ZAL_FUZZ_CORPUS "/" + corpus)) {
    SCOPED_TRACE(file.path().string());
    const std::string bytes = testing::readFile(file.path().string());
    entry(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    ++inputs;
  }
  return inputs;
}

TEST(FuzzCorpusTest, EveryFrameInputKeepsItsPromises) { EXPECT_GE(runAll("frame_fuzzer", fuzzFrames), 9); }

TEST(FuzzCorpusTest, EveryMessageInputKeepsItsPromises) {
  EXPECT_GE(runAll("message_fuzzer", fuzzMessage), 6);
}

}  // namespace
}  // namespace zal
