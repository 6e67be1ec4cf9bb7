#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <thread>

#include "tests/client/client_fixture.h"

namespace zal::testing {
namespace {

class LirraDeliveryTest : public ClientFixture {
 protected:
  static std::string recordLine(const std::string& text) {
    return R"({"__ipc__event_code__": 15, "category": "c", "level": 0, "logString": ")" + text +
           R"(", "sender": "tester", "time": 0u, "type": "t"})";
  }
  static void sendRecords(lirra::Client& client, const std::string& prefix, int count) {
    for (int i = 0; i < count; ++i) {
      ASSERT_EQ(client.log("t", "c", prefix + std::to_string(i)), LIRRA_OK) << i;
    }
  }
  static std::vector<std::string> recordLines(const std::string& prefix, int count) {
    std::vector<std::string> lines;
    for (int i = 0; i < count; ++i) lines.push_back(recordLine(prefix + std::to_string(i)));
    return lines;
  }
  /// Bytes that one record occupies in the queue.
  std::size_t recordSize() {
    lirra::Client client = open();
    EXPECT_EQ(client.log("t", "c", "r0"), LIRRA_OK);
    return client.statistics().queued_bytes;
  }
};

TEST_F(LirraDeliveryTest, RequestsArriveInOrder) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 5000);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests(), recordLines("r", 5000));
}

TEST_F(LirraDeliveryTest, TwoThreadsKeepEachItsOwnOrder) {
  startAgent();
  lirra::Client client = open();
  std::thread other([&] { sendRecords(client, "a", 2000); });
  sendRecords(client, "b", 2000);
  other.join();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);

  std::vector<std::string> ofA;
  std::vector<std::string> ofB;
  for (const std::string& line : agent->requests()) {
    (line.find("\"a") != std::string::npos ? ofA : ofB).push_back(line);
  }
  EXPECT_EQ(ofA, recordLines("a", 2000));
  EXPECT_EQ(ofB, recordLines("b", 2000));
}

TEST_F(LirraDeliveryTest, NothingConnectsBeforeThereIsSomethingToSend) {
  startAgent();
  lirra::Client client = open();
  EXPECT_EQ(client.statistics().connections, 0U);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(client.statistics().connections, 1U);
  EXPECT_EQ(client.statistics().connected, 1);
  EXPECT_EQ(client.statistics().agent_pid, ::getpid());
}

TEST_F(LirraDeliveryTest, SingleRecordLeavesWithoutAFlush) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 1);
  EXPECT_TRUE(agent->waitForRequests(1));
}

TEST_F(LirraDeliveryTest, FullQueueDropsAndCounts) {
  const std::size_t size = recordSize();
  lirra::Client client = open(10 * size);
  sendRecords(client, "r", 10);
  EXPECT_EQ(client.log("t", "c", "r0"), LIRRA_DROPPED);
  EXPECT_EQ(client.log("t", "c", "r0"), LIRRA_DROPPED);
  EXPECT_EQ(client.statistics().dropped, 2U);
  EXPECT_EQ(client.statistics().queued_bytes, 10 * size);
}

TEST_F(LirraDeliveryTest, RequestLargerThanTheQueueIsTooLarge) {
  lirra::Client client = open(4096);
  EXPECT_EQ(client.log("t", "c", std::string(8000, 'x')), LIRRA_TOO_LARGE);
  EXPECT_EQ(client.log("t", "c", "small"), LIRRA_OK);
}

TEST_F(LirraDeliveryTest, DroppedRequestsAreReportedWhenThereIsRoomAgain) {
  const std::size_t size = recordSize();
  lirra::Client client = open(10 * size);
  sendRecords(client, "r", 10);
  for (int i = 0; i < 7; ++i) EXPECT_EQ(client.log("t", "c", "r0"), LIRRA_DROPPED);
  startAgent();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  ASSERT_TRUE(agent->waitForRequests(11));

  auto expected = recordLines("r", 10);
  expected.emplace_back(
      R"({"__ipc__event_code__": 15, "category": "Client", "level": 0, "logString": "7 requests of this client )"
      R"(were dropped, for want of room in its queue or for their size", "sender": "tester", "time": 0u})");
  EXPECT_EQ(agent->requests(), expected);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests().size(), 11U) << "the same drops are reported once";
}

TEST_F(LirraDeliveryTest, AgentThatNeverReadsCostsABoundedQueueAndNoTime) {
  startAgent();
  agent->behave({Behaviour{.reads = false}});
  lirra::Client client = open(100'000);
  const std::string text(1000, 'x');
  std::uint64_t accepted = 0;
  for (int i = 0; i < 5000; ++i) accepted += client.log("t", "c", text) == LIRRA_OK ? 1 : 0;
  EXPECT_LT(accepted, 5000U);
  EXPECT_EQ(client.statistics().dropped, 5000 - accepted);
  EXPECT_LE(client.statistics().queued_bytes, 100'000U);
  EXPECT_EQ(client.flush(20), LIRRA_TIMEOUT);

  agent->startReading();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_TRUE(agent->waitForRequests(accepted + 1));
}

TEST_F(LirraDeliveryTest, FlushTimesOutWhenTheBarrierIsNotAnswered) {
  startAgent();
  agent->behave({Behaviour{.answersBarriers = false}});
  lirra::Client client = open();
  sendRecords(client, "r", 3);
  EXPECT_EQ(client.flush(50), LIRRA_TIMEOUT);
  EXPECT_TRUE(agent->waitForRequests(3));
}

TEST_F(LirraDeliveryTest, FlushWithoutAnAgentFailsAtOnceAndSaysWhy) {
  lirra::Client client = open();
  sendRecords(client, "r", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_UNREACHABLE);
  EXPECT_EQ(client.trouble(), socketPath() + ": No such file or directory");
}

TEST_F(LirraDeliveryTest, WhatWaitedArrivesOnceTheAgentIsThere) {
  lirra::Client client = open();
  sendRecords(client, "r", 20);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_UNREACHABLE);
  startAgent();
  EXPECT_TRUE(agent->waitForRequests(20)) << "the retry needs no further call";
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests(), recordLines("r", 20));
}

TEST_F(LirraDeliveryTest, ConnectsAgainAfterTheAgentWasRestarted) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 3);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  stopAgent();
  startAgent();
  sendRecords(client, "s", 3);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK) << "everything before was confirmed";
  EXPECT_EQ(agent->requests(), recordLines("s", 3));
  EXPECT_EQ(client.statistics().connections, 2U);
  EXPECT_EQ(client.statistics().unconfirmed, 0U);
}

TEST_F(LirraDeliveryTest, FlushSaysWhenWrittenRequestsWentDownUnconfirmed) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 3);
  ASSERT_TRUE(agent->waitForRequests(3));
  agent->closeConnections();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_LOST);
  EXPECT_EQ(client.statistics().unconfirmed, 3U);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK) << "it is told once";
}

TEST_F(LirraDeliveryTest, AgentThatDiesInTheMiddleOfAFrameGetsItWholeTheNextTime) {
  startAgent();
  agent->behave({Behaviour{.diesAfterBytes = 100'000}, Behaviour{}});
  lirra::Client client = open(16U << 20U);
  const std::string huge(3'000'000, 'x');
  sendRecords(client, "a", 1);
  EXPECT_EQ(client.log("t", "c", huge), LIRRA_OK);
  sendRecords(client, "b", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_LOST) << "the first record may never have been read";
  ASSERT_TRUE(agent->waitForConnections(2));
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);

  const auto requests = agent->requests();
  ASSERT_EQ(requests.size(), 3U);
  EXPECT_EQ(requests[0], recordLine("a0"));
  EXPECT_NE(requests[1].find("3000000"), std::string::npos);
  EXPECT_EQ(requests[2], recordLine("b0"));
  EXPECT_EQ(client.statistics().sent, 3U);
}

TEST_F(LirraDeliveryTest, AgentWithSenselessAnswersIsLeft) {
  startAgent();
  agent->behave({Behaviour{.answersBarriers = false, .sendsAtOnce = std::string(64, '\xFF')}, Behaviour{}});
  lirra::Client client = open();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_LOST);
  EXPECT_EQ(client.trouble().find("the agent's answer makes no sense: "), 0U) << client.trouble();
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
}

TEST_F(LirraDeliveryTest, ClosingWaitsForWhatIsQueued) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 1000);
  EXPECT_EQ(client.close(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests(), recordLines("r", 1000));
}

TEST_F(LirraDeliveryTest, ClosingWithoutAnAgentDoesNotWait) {
  lirra::Client client = open();
  sendRecords(client, "r", 1000);
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(client.close(kPatienceMs), LIRRA_UNREACHABLE);
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(kPatienceMs));
}

TEST_F(LirraDeliveryTest, ForkedChildTouchesNothingOfItsParents) {
  startAgent();
  lirra::Client client = open();
  sendRecords(client, "r", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  const pid_t child = ::fork();
  if (child == 0) {
    const bool dropped = client.pulse("t") == LIRRA_DROPPED && client.statistics().dropped == 1;
    const bool unreachable = client.flush(0) == LIRRA_UNREACHABLE && client.close(0) == LIRRA_UNREACHABLE;
    ::_exit(dropped && unreachable ? 0 : 1);
  }
  int status = -1;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  sendRecords(client, "s", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK) << "the parent's connection lives on";
  EXPECT_EQ(client.statistics().connections, 1U);
}

TEST_F(LirraDeliveryTest, SynchronousRequestsAreOneWriteEach) {
  startAgent();
  lirra::Client client = open(0, true);
  sendRecords(client, "r", 100);
  EXPECT_EQ(client.statistics().sent, 100U);
  EXPECT_EQ(client.statistics().queued_bytes, 0U);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests(), recordLines("r", 100));
}

TEST_F(LirraDeliveryTest, SynchronousRequestWithoutAnAgentIsUnreachableAndCounted) {
  lirra::Client client = open(0, true);
  EXPECT_EQ(client.log("t", "c", "r0"), LIRRA_UNREACHABLE);
  EXPECT_EQ(client.statistics().dropped, 1U);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_UNREACHABLE);
}

TEST_F(LirraDeliveryTest, SynchronousRequestFollowsTheAgentToItsNextConnection) {
  startAgent();
  lirra::Client client = open(0, true);
  sendRecords(client, "r", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  agent->closeConnections();
  sendRecords(client, "s", 1);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(client.statistics().connections, 2U);
}

}  // namespace
}  // namespace zal::testing
