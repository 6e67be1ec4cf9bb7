#include "fuzz/fuzz_entries.h"
#include "tests/support/fuzz_corpus.h"

namespace zal {
namespace {

TEST(BlackBoxCorpusTest, EveryRecordKeepsItsPromises) {
  EXPECT_GE(testing::runCorpus(ZAL_FUZZ_CORPUS "/black_box_fuzzer", fuzzBlackBox), 8);
}

}  // namespace
}  // namespace zal
