#include <array>
#include <atomic>
#include <string>

#include <gtest/gtest.h>

#include "platform/client_channel.h"
#include "tests/client_support/scripted_agent.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class UnixClientChannelTest : public ::testing::Test {
 protected:
  [[nodiscard]] ClientChannelOptions options() const {
    ClientChannelOptions result;
    result.address = directory / "agent";
    result.queueLimit = 64U << 20U;
    return result;
  }
  static ClientOutcome sendText(ClientChannel& channel, std::string_view text) {
    const std::array<RequestField, 2> fields{
        {{"__ipc__event_code__", std::int64_t{15}}, {"logString", text}}};
    return channel.send(fields);
  }

  TemporaryDirectory directory;
};

TEST_F(UnixClientChannelTest, AReportOfDropsThatIsDroppedItselfIsNoneOfThem) {
  ScriptedAgent agent(directory / "agent");
  ClientChannelOptions small = options();
  small.queueLimit = 1000;
  const std::string large(5000, 'x');
  std::atomic<int> reports = 0;
  small.roomAgain = [&](ClientChannel& channel, std::uint64_t dropped) {
    EXPECT_EQ(dropped, 1U);
    EXPECT_EQ(sendText(channel, large), ClientOutcome::tooLarge);
    ++reports;
    return false;
  };
  const auto channel = openClientChannel(small);
  EXPECT_EQ(sendText(*channel, large), ClientOutcome::tooLarge);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(channel->flush(30s), ClientOutcome::done);
  EXPECT_GE(reports, 1);
  EXPECT_EQ(channel->status().dropped, 1U);
}

TEST_F(UnixClientChannelTest, FastCallerCostsFarFewerWritesThanRecords) {
  ScriptedAgent agent(directory / "agent");
  const auto channel = openClientChannel(options());
  for (int i = 0; i < 20'000; ++i)
    ASSERT_EQ(sendText(*channel, "a record of some length"), ClientOutcome::done);
  EXPECT_EQ(channel->flush(30s), ClientOutcome::done);
  EXPECT_EQ(channel->status().sent, 20'000U);
  EXPECT_LT(channel->status().writes, 4'000U);
}

TEST_F(UnixClientChannelTest, SynchronousCallerWritesOnceForEachRecord) {
  ScriptedAgent agent(directory / "agent");
  ClientChannelOptions synchronous = options();
  synchronous.synchronous = true;
  const auto channel = openClientChannel(std::move(synchronous));
  for (int i = 0; i < 50; ++i) ASSERT_EQ(sendText(*channel, "x"), ClientOutcome::done);
  EXPECT_EQ(channel->status().writes, 50U);
}

TEST_F(UnixClientChannelTest, SynchronousCallerWaitsNoLongerThanTheLimitForAnAgentThatNeverReads) {
  ScriptedAgent agent(directory / "agent");
  agent.behave({ScriptedAgent::Behaviour{.reads = false}});
  ClientChannelOptions synchronous = options();
  synchronous.synchronous = true;
  synchronous.writeLimit = 20ms;
  const auto channel = openClientChannel(std::move(synchronous));
  const std::string text(100'000, 'x');
  ClientOutcome outcome = ClientOutcome::done;
  for (int i = 0; i < 1000 && outcome == ClientOutcome::done; ++i) outcome = sendText(*channel, text);
  EXPECT_EQ(outcome, ClientOutcome::dropped);
  EXPECT_FALSE(channel->status().connected);
  EXPECT_EQ(channel->status().trouble, "the agent did not read in time");
}

TEST_F(UnixClientChannelTest, AddressThatIsNoSocketPathIsUnreachable) {
  ClientChannelOptions tooLong = options();
  tooLong.address = "/" + std::string(200, 'x');
  const auto channel = openClientChannel(std::move(tooLong));
  EXPECT_EQ(channel->flush(10s), ClientOutcome::unreachable);
  EXPECT_EQ(channel->status().trouble, "/" + std::string(200, 'x') + ": too long for a socket's path");
}

TEST_F(UnixClientChannelTest, RetriesWithGrowingPausesWithoutACall) {
  ClientChannelOptions quick = options();
  quick.firstRetry = 1ms;
  quick.longestRetry = 4ms;
  const auto channel = openClientChannel(std::move(quick));
  ASSERT_EQ(sendText(*channel, "x"), ClientOutcome::done);
  EXPECT_EQ(channel->flush(10s), ClientOutcome::unreachable);
  ScriptedAgent agent(directory / "agent");
  EXPECT_TRUE(agent.waitForRequests(1));
}

}  // namespace
}  // namespace zal::testing
