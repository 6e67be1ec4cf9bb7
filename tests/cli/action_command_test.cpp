#include <limits>
#include <thread>

#include "cli/action_values.h"
#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class ActionCommandTest : public ToolFixture {
 protected:
  ActionCommandTest() { startAgent(); }
  std::string sent(const std::vector<std::string>& arguments) {
    const int code = run(arguments);
    if (code != 0) return "exit code " + std::to_string(code) + ": " + err;
    const auto requests = agent->requests();
    return requests.empty() ? "nothing" : requests.back();
  }
};

TEST_F(ActionCommandTest, NumberAloneIsEnough) {
  EXPECT_EQ(sent({"action", "2"}),
            R"({"__ipc__event_code__": 8, "action": 2, "sender": "lirractl", "session": ""})");
}

TEST_F(ActionCommandTest, ValuesKeepTheKindTheyLookLike) {
  EXPECT_EQ(
      sent({"action", "15", "useWifi=true", "n=-7", "real=1.5", "text=a=b", "--session", "Vistel", "--string",
            "s=7"}),
      R"({"__ipc__event_code__": 9, "action": 15, "sender": "lirractl", "session": "Vistel", "userInfo": )"
      R"({"n": -7, "real": "1.5", "s": "7", "text": "a=b", "useWifi": true}})");
}

TEST_F(ActionCommandTest, OptionForTextsTakesOneEach) {
  EXPECT_EQ(sent({"action", "10", "--string", "target=+15550100", "interval=5", "--string", "x=1"}),
            R"({"__ipc__event_code__": 9, "action": 10, "sender": "lirractl", "session": "", "userInfo": )"
            R"({"interval": 5, "target": "+15550100", "x": "1"}})");
}

TEST_F(ActionCommandTest, ValueWithoutAKeyIsWrongUsage) {
  EXPECT_EQ(run({"action", "2", "nonsense"}), 2);
  EXPECT_EQ(err, "lirractl: \"nonsense\" is no key=value\n  For example: useWifi=true\n");
  EXPECT_EQ(run({"action", "2", "--string", "=x"}), 2);
  EXPECT_EQ(run({"action", "two"}), 2);
  EXPECT_EQ(run({"action", "-1"}), 2);
  EXPECT_TRUE(agent->requests().empty());
}

TEST_F(ActionCommandTest, DumpNeedsASession) {
  EXPECT_EQ(run({"action", "14"}), 2);
  EXPECT_EQ(err,
            "lirractl: action 14 does nothing without a session type\n  Name one with --session TYPE.\n");
}

TEST_F(ActionCommandTest, DumpWithoutWaitingExpectsNoReply) {
  EXPECT_EQ(sent({"action", "14", "displayFlags=4", "--session", "Vistel", "--json"}),
            R"({"__ipc__event_code__": 9, "action": 14, "sender": "lirractl", "session": "Vistel", )"
            R"("userInfo": {"displayFlags": 4}})");
  EXPECT_EQ(out, "{\"result\": \"done\"}\n");
}

TEST_F(ActionCommandTest, DumpWithWaitingEndsWithTheArchive) {
  machine.onPause = [this] {
    agent->reply({{"replyResult", Value(ValueMap{{"logPath", Value(directory / "x.zip")}})}});
    std::this_thread::sleep_for(1ms);
  };
  EXPECT_EQ(run({"action", "14", "displayFlags=4", "--session", "Vistel", "--wait"}), 0) << err;
  EXPECT_EQ(plain(out), "ROOT/x.zip (its size cannot be read)\n");
}

TEST(ActionValueTest, KindsAreToldByTheirLook) {
  EXPECT_EQ(std::get<std::int64_t>(parseActionValue("k=-9223372036854775808", false)->value),
            std::numeric_limits<std::int64_t>::min());
  EXPECT_EQ(std::get<std::string>(parseActionValue("k=9223372036854775808", false)->value),
            "9223372036854775808");
  EXPECT_EQ(std::get<bool>(parseActionValue("k=false", false)->value), false);
  EXPECT_EQ(std::get<std::string>(parseActionValue("k=True", false)->value), "True");
  EXPECT_EQ(std::get<std::string>(parseActionValue("k=", false)->value), "");
  EXPECT_EQ(std::get<std::string>(parseActionValue("k=7", true)->value), "7");
  EXPECT_FALSE(parseActionValue("k", false));
  EXPECT_FALSE(parseActionValue("=v", false));
}

TEST(ActionValueTest, FlagsAreDecimalOrHexadecimal) {
  EXPECT_EQ(parseFlags("95"), 95U);
  EXPECT_EQ(parseFlags("0x5F"), 95U);
  EXPECT_EQ(parseFlags("0xFFFFFFFF"), 0xFFFFFFFFU);
  for (const char* text : {"", "0x", "-1", "0x100000000", "5F", "7 "})
    EXPECT_EQ(parseFlags(text), std::nullopt) << text;
}

}  // namespace
}  // namespace zal::testing
