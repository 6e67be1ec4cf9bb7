#include "platform/linux/client_channel/delivery_ledger.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

TEST(DeliveryLedgerTest, ARefusedConnectionSaysNothingToAFlushThatBeganAfterTheAttempt) {
  DeliveryLedger ledger;
  const DeliveryLedger::Flush before = ledger.openFlush();
  const std::uint64_t lastQuestion = ledger.lastQuestion();
  const DeliveryLedger::Flush after = ledger.openFlush();
  ledger.noteRefused("nobody there", false, lastQuestion);
  EXPECT_EQ(ledger.outcome(before.cookie), ClientOutcome::unreachable);
  EXPECT_EQ(ledger.outcome(after.cookie), std::nullopt);
  ledger.noteRefused("nobody there", false, ledger.lastQuestion());
  EXPECT_EQ(ledger.outcome(after.cookie), ClientOutcome::unreachable);
}

TEST(DeliveryLedgerTest, AnAgentThatIsBusyIsNotUnreachable) {
  DeliveryLedger ledger;
  const DeliveryLedger::Flush flush = ledger.openFlush();
  ledger.noteRefused("busy", true, ledger.lastQuestion());
  EXPECT_EQ(ledger.outcome(flush.cookie), std::nullopt);
}

}  // namespace
}  // namespace zal::testing
