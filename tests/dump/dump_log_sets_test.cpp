#include "dump/dump_log_sets.h"

#include <gmock/gmock.h>

namespace zal {
namespace {

using ::testing::ElementsAre;

TEST(DumpLogSetsTest, ATypeOfItsOwnHasItsOwnSet) {
  EXPECT_THAT(dumpLogSets("Registration"), ElementsAre("Registration"));
  EXPECT_THAT(dumpLogSets("Vistel2"), ElementsAre("Vistel2"));
  EXPECT_THAT(dumpLogSets(""), ElementsAre(""));
}

TEST(DumpLogSetsTest, TheStackKnowsItsTypesInAnyCase) {
  for (const char* type : {"Vistel", "vistel", "MESSAGES", "Nexa"}) {
    EXPECT_THAT(dumpLogSets(type),
                ElementsAre(type, "Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"));
  }
}

TEST(DumpLogSetsTest, GamesAreKnownByTheBeginningOfTheirNameInThisCaseOnly) {
  EXPECT_THAT(dumpLogSets("GameRoom"),
              ElementsAre("GameRoom", "Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"));
  EXPECT_THAT(dumpLogSets("Game"),
              ElementsAre("Game", "Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"));
  EXPECT_THAT(dumpLogSets("gameRoom"), ElementsAre("gameRoom"));
  EXPECT_THAT(dumpLogSets("GAME"), ElementsAre("GAME"));
}

}  // namespace
}  // namespace zal
