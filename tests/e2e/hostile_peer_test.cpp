#include <random>

#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;
using testing::RawClient;

/// Peers that mean no good, and what others and the host notice of them.
class HostilePeerE2eTest : public testing::E2eFixture {
 protected:
  void SetUp() override {
    start();
    neighbour = std::make_unique<RawClient>(sandbox.socketPath());
    ASSERT_TRUE(neighbour->barrier());
  }
  void expectNeighbourUnharmed() {
    ASSERT_TRUE(neighbour->sendLog("Neighbour", "line " + std::to_string(++_lines)));
    ASSERT_TRUE(neighbour->barrier());
    EXPECT_THAT(sandbox.wholeLogSet("Neighbour"), EndsWith("line " + std::to_string(_lines) + "\n"));
  }
  static std::string header(std::uint32_t length, std::uint16_t version, std::uint16_t kind) {
    std::string bytes;
    FrameHeader frame;
    frame.version = version;
    frame.kind = static_cast<FrameKind>(kind);
    appendFrame(bytes, frame, {});
    for (int i = 0; i < 4; ++i) bytes[static_cast<std::size_t>(i)] = static_cast<char>(length >> (8 * i));
    return bytes;
  }
  [[nodiscard]] std::vector<std::string> namesIn(const std::string& directory) const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(directory)) {
      names.push_back(entry.path().filename().string());
    }
    std::sort(names.begin(), names.end());
    return names;
  }

  std::unique_ptr<RawClient> neighbour;

 private:
  int _lines = 0;
};

TEST_F(HostilePeerE2eTest, AHugeLengthAnUnknownVersionOrKindCostsTheSenderItsConnection) {
  for (const std::string& bytes : {header(0xFFFFFFFF, 1, 0), header(0, 2, 0), header(0, 1, 77)}) {
    RawClient client(sandbox.socketPath());
    client.sendBytes(bytes);
    EXPECT_TRUE(client.waitUntilClosed());
    expectNeighbourUnharmed();
  }
}

TEST_F(HostilePeerE2eTest, ATornFrameHarmsNobodyWhenItsSenderLeaves) {
  std::string frame = header(1000, 1, 0);
  for (const std::size_t length : {std::size_t{1}, std::size_t{15}, std::size_t{16}}) {
    { RawClient(sandbox.socketPath()).sendBytes(std::string_view(frame).substr(0, length)); }
    expectNeighbourUnharmed();
  }
}

TEST_F(HostilePeerE2eTest, APayloadThatIsNoMapIsSkippedAndItsSenderStaysUsable) {
  RawClient client(sandbox.socketPath());
  std::string bytes;
  appendFrame(bytes, FrameHeader{.length = 9}, "\xFF\xFF\xFF not flex");
  FrameHeader garbage;
  garbage.length = 24;
  bytes.clear();
  appendFrame(bytes, garbage, std::string(24, '\xA5'));
  client.sendBytes(bytes);
  client.sendLog("Recovered", "still here");
  ASSERT_TRUE(client.barrier());
  EXPECT_THAT(sandbox.wholeLogSet("Recovered"), EndsWith("[test:e2e] still here\n"));
  expectNeighbourUnharmed();
}

TEST_F(HostilePeerE2eTest, RandomBytesHarmNobody) {
  std::mt19937 random(20240502);
  for (int round = 0; round < 50; ++round) {
    RawClient client(sandbox.socketPath());
    std::string bytes(random() % 5000 + 1, '\0');
    for (char& byte : bytes) byte = static_cast<char>(random());
    // Every other one begins as a good frame does, so that the payload is looked at.
    if (round % 2 == 0) bytes = header(static_cast<std::uint32_t>(bytes.size()), 1, 0) + bytes;
    client.sendBytes(bytes);
  }
  expectNeighbourUnharmed();
}

TEST_F(HostilePeerE2eTest, HostileTypesAndCategoriesLeaveNothingOutsideTheRoots) {
  const std::string names[] = {
      "../../x", "..", "/etc/x", "$(touch X)", std::string("a\0b", 3), "a\nb", std::string(4096, 'k')};
  RawClient client(sandbox.socketPath());
  const auto before = namesIn(sandbox / "");
  for (const std::string& name : names) {
    const std::string collected = sandbox / "tmp/collected.txt";
    testing::writeFile(collected, "collected");
    client.beginSession(name);
    for (const char* text : {"one", "two", "three"}) client.sendCheckpoint(name, text, 1714651388.0);
    client.sendLog(name, "a record");
    client.send([&](MessageBuilder& message) {
      message.setInt64("__ipc__event_code__", 14);
      message.setString("session", name);
      message.setString("category", name);
      message.setString("path", collected);
    });
  }
  ASSERT_TRUE(client.barrier());
  expectNeighbourUnharmed();
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_EQ(namesIn(sandbox / ""), before);
  EXPECT_THAT(namesIn(sandbox.stateRoot), ElementsAre("Logs", "Reports"));
  EXPECT_THAT(namesIn(sandbox.reportRoot()),
              ElementsAre("$(touch X)", "Current", "a_b", std::string(255, 'k'), "x"));
  EXPECT_FALSE(std::filesystem::exists("/etc/x"));
  EXPECT_FALSE(std::filesystem::exists("X"));
}

}  // namespace
}  // namespace zal
