#include <signal.h>

#include <atomic>
#include <thread>

#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using testing::AgentSandbox;
using testing::linesOf;
using testing::RawClient;

constexpr int kRecords = 100'000;
constexpr int kRecordsPerBarrier = 1'000;

std::string recordText(int number) {
  return "record " + std::to_string(number) + " " + std::string(80, static_cast<char>('a' + number % 26));
}

/// The numbers of the whole records of a log set, in order.
std::vector<int> recordNumbers(const AgentSandbox& sandbox, const std::string& type) {
  std::vector<int> numbers;
  for (const std::string& line : linesOf(sandbox.wholeLogSet(type))) {
    const std::size_t at = line.find("[test:e2e] record ");
    if (at == std::string::npos) continue;
    const int number = std::stoi(line.substr(at + 18));
    if (line.substr(at + 11) == recordText(number)) numbers.push_back(number);
  }
  return numbers;
}

class LoadE2eTest : public testing::E2eFixture {};

TEST_F(LoadE2eTest, RecordsBeforeTheLastAnsweredBarrierSurviveAKillOnceAndInOrder) {
  sandbox.logSettings += "rotationSize = 2097152\n";  // some rotations, and none that is dropped
  start();
  RawClient client(sandbox.socketPath());
  std::thread sender([&] {
    MessageBuilder builder;
    std::string bytes;
    for (int number = 1; number <= kRecords; ++number) {
      builder.setInt64("__ipc__event_code__", 15);
      builder.setString("logString", recordText(number));
      builder.setString("sender", "test");
      builder.setString("category", "e2e");
      builder.setString("type", "Killed");
      builder.finish(bytes, FrameKind::message, 0);
      if (number % kRecordsPerBarrier != 0) continue;
      RawClient::appendBarrier(bytes, static_cast<std::uint64_t>(number));
      if (!client.sendBytes(bytes)) return;
      bytes.clear();
    }
  });
  std::uint64_t confirmed = 0;
  bool killed = false;
  while (const auto answer = client.receive()) {
    confirmed = answer->cookie;
    if (!killed && confirmed >= kRecords / 2) {
      agent->signal(SIGKILL);
      killed = true;
    }
    if (confirmed == kRecords) break;
  }
  agent->signal(SIGKILL);
  EXPECT_EQ(agent->waitForExit(), -SIGKILL);
  sender.join();
  ASSERT_GE(confirmed, static_cast<std::uint64_t>(kRecords / 2));

  const auto expectAllConfirmed = [&] {
    const std::vector<int> numbers = recordNumbers(sandbox, "Killed");
    ASSERT_GE(numbers.size(), confirmed);
    for (std::size_t i = 0; i < numbers.size(); ++i) ASSERT_EQ(numbers[i], static_cast<int>(i + 1));
  };
  expectAllConfirmed();

  // The next agent repairs what the kill cut off, and loses nothing by it either.
  start();
  RawClient next(sandbox.socketPath());
  ASSERT_TRUE(next.barrier());
  EXPECT_EQ(agent->terminate(), 0);
  expectAllConfirmed();
}

TEST_F(LoadE2eTest, SixtyFourClientsAtOnceEachFindTheirLinesInTheirOwnFilesInOrder) {
  constexpr int kClients = 64;
  constexpr int kEntries = ZAL_LOAD_ENTRIES;
  start();
  std::vector<std::thread> clients;
  std::atomic<int> confirmed = 0;
  for (int number = 0; number < kClients; ++number) {
    clients.emplace_back([&, type = "Client" + std::to_string(number)] {
      RawClient client(sandbox.socketPath());
      client.beginSession(type);
      MessageBuilder builder;
      std::string bytes;
      for (int entry = 0; entry < kEntries; ++entry) {
        builder.setInt64("__ipc__event_code__", 3);
        builder.setString("logString", type + " entry " + std::to_string(entry));
        builder.setString("sessionType", type);
        builder.setString("sender", "test");
        builder.setReal("time", 1714651388.0 + entry);
        builder.finish(bytes, FrameKind::message, 0);
        if (bytes.size() < 65536 && entry + 1 < kEntries) continue;
        if (!client.sendBytes(bytes)) return;
        bytes.clear();
      }
      if (client.barrier()) ++confirmed;
    });
  }
  for (std::thread& client : clients) client.join();
  ASSERT_EQ(confirmed, kClients);
  EXPECT_EQ(agent->terminate(), 0);

  for (int number = 0; number < kClients; ++number) {
    const std::string type = "Client" + std::to_string(number);
    std::string expectedSession;
    std::string expectedRecords;
    for (int entry = 0; entry < kEntries; ++entry) {
      expectedSession += "[Sender: test] " + type + " entry " + std::to_string(entry) + "\n";
      expectedRecords += "[test:Default] " + type + " entry " + std::to_string(entry) + "\n";
    }
    std::string session;
    for (const std::string& line : linesOf(sandbox.sessionFile(type, "Verbose Log"))) {
      const std::size_t end = line.find("   [");
      if (line.find(" entry ") != std::string::npos) session += line.substr(0, end) + "\n";
    }
    std::string records;
    for (const std::string& line : linesOf(sandbox.wholeLogSet(type))) {
      const std::size_t at = line.find("[test:Default]");
      if (at != std::string::npos) records += line.substr(at) + "\n";
    }
    ASSERT_TRUE(session == expectedSession) << type << ": " << session.size() << " bytes of entries";
    ASSERT_TRUE(records == expectedRecords) << type << ": " << records.size() << " bytes of records";
  }
}

}  // namespace
}  // namespace zal
