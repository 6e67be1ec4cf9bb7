#include "platform/linux/bus/telephony/ofono_signal_sampler.h"

#include <filesystem>

#include "tests/linux/bus_ofono/ofono_fixture.h"

namespace zal::testing {
namespace {

using Answers = std::vector<std::string>;

class OfonoSignalSamplerTest : public OfonoFixture {
 protected:
  BusConnection connection{host, host.systemBus, "system bus"};
  OfonoSignalSampler sampler{connection};
  Answers answers;

  void ask() {
    sampler.sample([this](std::optional<CellularSignal> signal) {
      answers.push_back(signal ? std::to_string(signal->rssi) + " " + std::to_string(signal->percentage) +
                                     " " + std::to_string(signal->graded)
                               : "nothing");
    });
  }
  /// Asks and waits for the answer.
  std::string sample() {
    const std::size_t before = answers.size();
    ask();
    EXPECT_TRUE(runUntil([&] { return answers.size() > before; }));
    return answers.empty() ? "" : answers.back();
  }
  /// Samples until the answer is that one: a daemon that is played is late when the machine has much to do.
  bool becomes(const std::string& wanted) {
    const SteadyTime deadline = clock.steadyNow() + std::chrono::minutes(3);
    while (sample() != wanted && clock.steadyNow() < deadline) {
    }
    return answers.back() == wanted;
  }
  void connect() {
    EXPECT_TRUE(runUntil([this] { return connection.connection() != nullptr; }));
  }
};

TEST_F(OfonoSignalSamplerTest, TheFirstQuestionMakesTheConnectionAndIsAnsweredWithNothing) {
  startOfono();
  ask();
  EXPECT_EQ(answers, Answers{"nothing"});
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
}

TEST_F(OfonoSignalSamplerTest, EachQuestionGetsTheStrengthOfItsTime) {
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
  change("NetworkRegistration", "Strength=dbus.Byte(30)");
  EXPECT_TRUE(becomes("-95 30 1"));
  change("NetworkRegistration", "Strength=dbus.Byte(0)");
  EXPECT_TRUE(becomes("-113 0 0"));
}

TEST_F(OfonoSignalSamplerTest, NothingIsToldWithoutDaemonModemOrStrength) {
  connect();
  EXPECT_EQ(sample(), "nothing");
  startOfono(false);
  EXPECT_EQ(sample(), "nothing");
  startOfono();
  change("NetworkRegistration", "Strength='strong'");
  EXPECT_EQ(sample(), "nothing");
  answerWith("NetworkRegistration", "['strong']", "as");
  EXPECT_EQ(sample(), "nothing");
  answerWith("NetworkRegistration", "{'Status': 'searching'}");
  EXPECT_EQ(sample(), "nothing");
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(OfonoSignalSamplerTest, WhileAQuestionIsOpenAnotherIsAnsweredWithNothingAtOnce) {
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
  answers.clear();
  ask();
  ask();
  EXPECT_EQ(answers, Answers{"nothing"});
  EXPECT_TRUE(runUntil([this] { return answers.size() == 2; }));
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(answers.size(), 2U);
  EXPECT_TRUE(becomes("-63 80 3"));
}

TEST_F(OfonoSignalSamplerTest, ADaemonThatHangsIsAnsweredForInTimeAndPickedUpAgain) {
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
  ofono->hang();
  answers.clear();
  EXPECT_EQ(strayWaitsDuring([this] {
              ask();
              EXPECT_TRUE(runUntil([this] { return answers.size() == 1; }));
            }),
            0U);
  EXPECT_EQ(answers.back(), "nothing");
  ofono->goOn();
  EXPECT_TRUE(becomes("-63 80 3"));
}

TEST_F(OfonoSignalSamplerTest, ADaemonThatDiesIsFoundWhenItIsBack) {
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
  ofono->kill();
  EXPECT_EQ(sample(), "nothing");
  startOfono();
  EXPECT_TRUE(becomes("-63 80 3"));
}

TEST_F(OfonoSignalSamplerTest, ABusThatDiesAnswersTheOpenQuestionOnceAndLaterOnesGoOn) {
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
  ofono->hang();
  answers.clear();
  ask();
  runFor(std::chrono::milliseconds(20));
  bus.kill();
  EXPECT_TRUE(runUntil([this] { return answers.size() == 1; }));
  EXPECT_TRUE(runUntil([this] { return connection.connection() == nullptr; }));
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(answers, Answers{"nothing"});
  bus.start();
  startOfono();
  connect();
  EXPECT_TRUE(becomes("-63 80 3"));
}

TEST_F(OfonoSignalSamplerTest, ADaemonThatMayBeStartedIsNotStarted) {
  const std::string started = bus.servicesDirectory() + "/started";
  writeFile(bus.servicesDirectory() + "/org.ofono.service",
            "[D-BUS Service]\nName=org.ofono\nExec=/usr/bin/touch " + started + "\n");
  bus.kill();
  bus.start();
  connect();
  EXPECT_EQ(sample(), "nothing");
  EXPECT_FALSE(bus.hasOwner("org.ofono"));
  EXPECT_FALSE(std::filesystem::exists(started));
}

}  // namespace
}  // namespace zal::testing
