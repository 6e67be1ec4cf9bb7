#include <gtest/gtest.h>

#include "platform/linux/absent/absent_radio_coexistence.h"
#include "platform/linux/absent/absent_telephony.h"

namespace zal::testing {
namespace {

TEST(AbsentTelephonyTest, NobodyCanConnect) {
  AbsentTelephony telephony;
  EXPECT_EQ(telephony.connect(), nullptr);
  EXPECT_EQ(telephony.connect(), nullptr);
  int answers = 0;
  telephony.sampleSignal([&answers](const std::optional<CellularSignal>& signal) {
    ++answers;
    EXPECT_FALSE(signal);
  });
  EXPECT_EQ(answers, 1);
}

TEST(AbsentRadioCoexistenceTest, HasNothingToCall) {
  AbsentRadioCoexistence coexistence;
  EXPECT_FALSE(coexistence.logDumpEntryPoint());
}

}  // namespace
}  // namespace zal::testing
