#include "platform/linux/device_support/linux_device_support.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <thread>
#include <vector>

#include "tests/support/manual_run_loop.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using std::chrono::milliseconds;

class ScriptedCellularData : public CellularDataStatus {
 public:
  std::vector<Handler> asked;
  void ask(Handler handler) override { asked.push_back(std::move(handler)); }
  void answer(CellularData data) {
    auto handlers = std::exchange(asked, {});
    for (const Handler& handler : handlers) handler(data);
  }
};

class LinuxDeviceSupportTest : public ::testing::Test {
 protected:
  ManualRunLoop loop;
  ScriptedCellularData modem;
  TemporaryDirectory root;
  std::unique_ptr<LinuxDeviceSupport> support;

  void make(std::optional<bool> configured = std::nullopt, bool looksAtStart = true) {
    support =
        std::make_unique<LinuxDeviceSupport>(loop, loop, modem,
                                             LinuxDeviceSupport::Options{.videoCallsOverCellular = configured,
                                                                         .cellularInterface = "wwan0",
                                                                         .looksAtStart = looksAtStart,
                                                                         .root = root.path()});
  }
  /// How many questions the daemons were asked because of one of ours.
  std::size_t questionsForOne() {
    const std::size_t before = modem.asked.size();
    (void)support->videoCallsOverCellularAvailable();
    loop.drain();
    return modem.asked.size() - before;
  }
  void setInterfaceFlags(const std::string& flags) { writeFile(root / "sys/class/net/wwan0/flags", flags); }
  bool available() { return support->videoCallsOverCellularAvailable(); }
};

TEST_F(LinuxDeviceSupportTest, TheNameIsThatOfTheMachineInfoElseTheHostName) {
  make();
  std::array<char, 256> host{};
  ASSERT_EQ(::gethostname(host.data(), host.size() - 1), 0);
  EXPECT_EQ(support->deviceName(), host.data());
  writeFile(root / "etc/machine-info", "PRETTY_HOSTNAME=\"Kim's phone\"\n");
  EXPECT_EQ(support->deviceName(), "Kim's phone");
  writeFile(root / "etc/machine-info", "PRETTY_HOSTNAME=\"Kim\"\n");
  EXPECT_EQ(support->deviceName(), "Kim");
}

TEST_F(LinuxDeviceSupportTest, AConfiguredWordGoesBeforeEverythingAndAsksNobody) {
  setInterfaceFlags("0x1043\n");
  make(false);
  EXPECT_FALSE(available());
  make(true);
  EXPECT_TRUE(available());
  EXPECT_EQ(questionsForOne(), 0U);
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(LinuxDeviceSupportTest, TheDaemonsAreAskedHalfASecondAfterTheStart) {
  make();
  loop.advance(milliseconds(499));
  EXPECT_EQ(modem.asked.size(), 0U);
  loop.advance(milliseconds(1));
  EXPECT_EQ(modem.asked.size(), 1U);
  EXPECT_EQ(loop.pendingTimers(), 0U);
  modem.answer(CellularData::available);
  EXPECT_TRUE(available());
}

TEST_F(LinuxDeviceSupportTest, WhereNothingDependsOnItNobodyIsAskedAtTheStart) {
  make(std::nullopt, false);
  EXPECT_EQ(loop.pendingTimers(), 0U);
  EXPECT_EQ(questionsForOne(), 1U);
}

TEST_F(LinuxDeviceSupportTest, AnIdleAgentAsksNobody) {
  make();
  loop.advance(milliseconds(500));
  modem.answer(CellularData::available);
  loop.advance(std::chrono::hours(1));
  EXPECT_EQ(modem.asked.size(), 0U);
}

TEST_F(LinuxDeviceSupportTest, AnAnswerIsKnownUntilTheNextOne) {
  make();
  loop.advance(milliseconds(500));
  modem.answer(CellularData::available);
  EXPECT_TRUE(available());
  loop.advance(std::chrono::seconds(10));
  EXPECT_TRUE(available());
  loop.drain();
  modem.answer(CellularData::unavailable);
  EXPECT_FALSE(available());
}

TEST_F(LinuxDeviceSupportTest, AWordIsOldAfterTenSeconds) {
  make(std::nullopt, false);
  EXPECT_EQ(questionsForOne(), 1U);
  modem.answer(CellularData::unavailable);
  loop.advance(milliseconds(9999));
  EXPECT_EQ(questionsForOne(), 0U);
  loop.advance(milliseconds(1));
  EXPECT_EQ(questionsForOne(), 1U);
}

TEST_F(LinuxDeviceSupportTest, WhileTheDaemonsAreAskedTheyAreNotAskedAgain) {
  make(std::nullopt, false);
  EXPECT_EQ(questionsForOne(), 1U);
  loop.advance(std::chrono::minutes(1));
  EXPECT_EQ(questionsForOne(), 0U);
}

TEST_F(LinuxDeviceSupportTest, BeforeAnAnswerTheCellularInterfaceBeingUpSaysIt) {
  make();
  EXPECT_FALSE(available());
  setInterfaceFlags("0x1002\n");
  EXPECT_FALSE(available());
  setInterfaceFlags("0x1003\n");
  EXPECT_TRUE(available());
  setInterfaceFlags("up\n");
  EXPECT_FALSE(available());
}

TEST_F(LinuxDeviceSupportTest, WithoutAServiceTheInterfaceSaysItAgain) {
  setInterfaceFlags("0x1003\n");
  make();
  loop.advance(milliseconds(500));
  modem.answer(CellularData::unavailable);
  EXPECT_FALSE(available());
  loop.advance(std::chrono::seconds(10));
  EXPECT_FALSE(available());
  loop.drain();
  modem.answer(CellularData::noService);
  EXPECT_TRUE(available());
}

TEST_F(LinuxDeviceSupportTest, ADaemonThatDoesNotAnswerLeavesTheLastWord) {
  make();
  loop.advance(milliseconds(500));
  modem.answer(CellularData::available);
  loop.advance(std::chrono::seconds(10));
  EXPECT_EQ(questionsForOne(), 1U);
  modem.answer(CellularData::noAnswer);
  EXPECT_TRUE(available());
}

TEST_F(LinuxDeviceSupportTest, AnyThreadMayAskAndNobodyIsAskedThere) {
  make(std::nullopt, false);
  std::thread([this] {
    EXPECT_FALSE(available());
    EXPECT_FALSE(support->deviceName().empty());
  }).join();
  EXPECT_EQ(modem.asked.size(), 0U);
  loop.drain();
  EXPECT_EQ(modem.asked.size(), 1U);
}

TEST_F(LinuxDeviceSupportTest, AnAnswerThatComesAfterTheEndIsDropped) {
  make(std::nullopt, false);
  EXPECT_EQ(questionsForOne(), 1U);
  (void)available();
  support.reset();
  loop.drain();
  modem.answer(CellularData::available);
  make();
  EXPECT_FALSE(available());
}

}  // namespace
}  // namespace zal::testing
