#include "fuzz/fuzz_entries.h"
#include "tests/support/fuzz_corpus.h"

namespace zal {
namespace {

TEST(FuzzCorporaTest, EveryConfigurationKeepsItsPromises) {
  EXPECT_GE(testing::runCorpus(ZAL_FUZZ_CORPUS "/configuration_fuzzer", fuzzConfiguration), 10);
}

TEST(FuzzCorporaTest, EveryPropertyListKeepsItsPromises) {
  EXPECT_GE(testing::runCorpus(ZAL_FUZZ_CORPUS "/property_list_fuzzer", fuzzPropertyList), 7);
}

TEST(FuzzCorporaTest, EveryNameKeepsItsPromises) {
  EXPECT_GE(testing::runCorpus(ZAL_FUZZ_CORPUS "/name_fuzzer", fuzzName), 6);
}

TEST(FuzzCorporaTest, EveryAlertKeepsItsPromises) {
  EXPECT_GE(testing::runCorpus(ZAL_FUZZ_CORPUS "/alert_fuzzer", fuzzAlert), 11);
}

}  // namespace
}  // namespace zal
