#include "platform/memory_ledger.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

constexpr std::uint64_t kMebibyte = 1U << 20U;

/// Gives up all it holds, as if a disk had no end.
class Holder : public MemoryUser {
 public:
  explicit Holder(MemoryLedger& ledger) : _ledger(ledger), _hold(ledger.makeHold()) { ledger.addUser(*this); }
  ~Holder() override { _ledger.removeUser(*this); }

  void hold(const std::shared_ptr<MemoryAccount>& payer, std::uint64_t bytes) {
    _ledger.setPayer(payer);
    _hold.add(bytes);
    _ledger.relieve(*this);
  }
  [[nodiscard]] std::uint64_t bytes() const { return _hold.bytes(); }
  [[nodiscard]] std::uint64_t canGiveUp(const MemoryAccount* account) const override {
    return account == nullptr ? _hold.bytes() : _hold.bytesOf(*account);
  }
  void giveUp() override { _hold.release(_hold.bytes()); }

 private:
  MemoryLedger& _ledger;
  MemoryHold _hold;
};

class MemoryLedgerTest : public ::testing::Test {
 protected:
  MemoryLedger ledger{{.session = 10 * kMebibyte, .peer = 20 * kMebibyte, .total = 30 * kMebibyte}};
  Holder one{ledger}, two{ledger}, three{ledger};
  std::shared_ptr<MemoryAccount> ann = std::make_shared<MemoryAccount>();
  std::shared_ptr<MemoryAccount> bob = std::make_shared<MemoryAccount>();
};

TEST_F(MemoryLedgerTest, AUserKeepsWhatTheLimitOfASessionAllows) {
  one.hold(ann, 10 * kMebibyte);
  EXPECT_EQ(one.bytes(), 10 * kMebibyte);
  one.hold(ann, 1);
  EXPECT_EQ(one.bytes(), 0U);
  EXPECT_EQ(ledger.total(), 0U);
  EXPECT_EQ(ann->bytes, 0U);
}

TEST_F(MemoryLedgerTest, OverTheLimitOfAClientItsLargestUserGivesUp) {
  one.hold(ann, 8 * kMebibyte);
  two.hold(bob, 9 * kMebibyte);
  two.hold(ann, 3 * kMebibyte / 4);
  three.hold(ann, 9 * kMebibyte);
  one.hold(ann, 2 * kMebibyte);
  EXPECT_EQ(one.bytes(), 10 * kMebibyte);
  three.hold(ann, kMebibyte / 2);
  EXPECT_EQ(one.bytes(), 0U);
  EXPECT_EQ(two.bytes(), 9 * kMebibyte + 3 * kMebibyte / 4);
  EXPECT_EQ(three.bytes(), 9 * kMebibyte + kMebibyte / 2);
}

TEST_F(MemoryLedgerTest, OverTheTotalTheLargestUserGivesUpWhoeverPays) {
  Holder four{ledger};
  one.hold(ann, 9 * kMebibyte);
  two.hold(bob, 10 * kMebibyte);
  three.hold(ann, 9 * kMebibyte);
  four.hold(nullptr, 3 * kMebibyte);
  EXPECT_EQ(two.bytes(), 0U);
  EXPECT_EQ(one.bytes() + three.bytes() + four.bytes(), 21 * kMebibyte);
  EXPECT_EQ(ledger.total(), 21 * kMebibyte);
}

TEST_F(MemoryLedgerTest, LittleIsLeftWhereItIs) {
  Holder four{ledger};
  MemoryHold onItsWay = ledger.makeHold();
  ledger.setPayer(bob);
  onItsWay.add(31 * kMebibyte);
  four.hold(ann, kMebibyte - 1);
  EXPECT_EQ(four.bytes(), kMebibyte - 1);
  four.hold(ann, 1);
  EXPECT_EQ(four.bytes(), 0U);
}

TEST_F(MemoryLedgerTest, AClientIsOverItsShareBeyondItsLimit) {
  MemoryHold hold = ledger.makeHold();
  ledger.setPayer(ann);
  hold.add(20 * kMebibyte);
  EXPECT_FALSE(ledger.isOverShare(*ann));
  hold.add(1);
  EXPECT_TRUE(ledger.isOverShare(*ann));
  EXPECT_FALSE(ledger.isOverShare(*bob));
}

TEST_F(MemoryLedgerTest, BeyondTheTotalTheShareIsAnEqualPart) {
  MemoryHold hold = ledger.makeHold();
  ledger.setPayer(ann);
  hold.add(16 * kMebibyte);
  ledger.setPayer(bob);
  hold.add(14 * kMebibyte);
  EXPECT_FALSE(ledger.isOverShare(*ann));
  hold.add(1);
  EXPECT_TRUE(ledger.isOverShare(*ann));
  EXPECT_FALSE(ledger.isOverShare(*bob));
}

TEST_F(MemoryLedgerTest, WhoWaitsIsCalledOnceWhenMemoryComesBack) {
  int calls = 0;
  MemoryHold hold = ledger.makeHold();
  hold.add(10);
  ledger.onRelease([&calls] { ++calls; });
  EXPECT_EQ(calls, 0);
  hold.release(4);
  hold.release(4);
  EXPECT_EQ(calls, 1);
}

TEST_F(MemoryLedgerTest, AHoldThatGoesGivesBackWhatItHasAndWhatItTookOver) {
  {
    MemoryHold hold = ledger.makeHold();
    MemoryHold other = ledger.makeHold();
    ledger.setPayer(ann);
    hold.add(3);
    ledger.setPayer(bob);
    other.add(4);
    hold.absorb(other);
    EXPECT_EQ(hold.bytes(), 7U);
    EXPECT_EQ(other.bytes(), 0U);
    EXPECT_EQ(hold.bytesOf(*bob), 4U);
  }
  EXPECT_EQ(ledger.total(), 0U);
  EXPECT_EQ(ann->bytes + bob->bytes, 0U);
}

}  // namespace
}  // namespace zal
