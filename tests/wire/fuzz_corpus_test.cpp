#include "tests/support/fuzz_corpus.h"
#include "fuzz/fuzz_entries.h"

namespace zal {
namespace {

using testing::runCorpus;

TEST(FuzzCorpusTest, EveryFrameInputKeepsItsPromises) {
  EXPECT_GE(runCorpus(ZAL_FUZZ_CORPUS "/frame_fuzzer", fuzzFrames), 9);
}

TEST(FuzzCorpusTest, EveryMessageInputKeepsItsPromises) {
  EXPECT_GE(runCorpus(ZAL_FUZZ_CORPUS "/message_fuzzer", fuzzMessage), 6);
}

}  // namespace
}  // namespace zal
