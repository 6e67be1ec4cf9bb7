#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class RequestCommandsTest : public ToolFixture {
 protected:
  RequestCommandsTest() { startAgent(); }
  /// The request that the command sends; the exit code when it fails.
  std::string sent(const std::vector<std::string>& arguments, const std::string& input = "") {
    const std::size_t before = agent->requests().size();
    const int code = run(arguments, input);
    if (code != 0) return "exit code " + std::to_string(code) + ": " + err;
    EXPECT_EQ(out, "");
    EXPECT_EQ(err, "");
    const auto requests = agent->requests();
    return requests.size() == before + 1 ? requests.back() : "not one request";
  }
  static std::string request(const std::string& fields) {
    return R"({"__ipc__event_code__": )" + fields + "}";
  }
};

TEST_F(RequestCommandsTest, BeginAddsUpItsFlags) {
  EXPECT_EQ(
      sent({"begin", "Vistel", "--initiator", "--ping", "--begin-flags", "64", "--end-flags", "3"}),
      request(
          R"(0, "beginSessionFlags": 69, "endSessionFlags": 3, "sender": "lirractl", "sessionType": "Vistel")"));
  EXPECT_EQ(
      sent({"begin"}),
      request(R"(0, "beginSessionFlags": 0, "endSessionFlags": 0, "sender": "lirractl", "sessionType": "")"));
}

TEST_F(RequestCommandsTest, EndAndPulseNameTheSession) {
  EXPECT_EQ(sent({"end", "Vistel"}), request(R"(1, "sender": "lirractl", "sessionType": "Vistel")"));
  EXPECT_EQ(sent({"pulse", "Vistel"}), request(R"(7, "sender": "lirractl", "session": "Vistel")"));
}

TEST_F(RequestCommandsTest, CheckpointMayBeNamedLikeACommand) {
  EXPECT_EQ(sent({"checkpoint", "Vistel", "end", "--time", "99.5"}),
            request(R"(2, "checkpoint": "end", "sender": "lirractl", "session": "Vistel", "time": 99.5)"));
}

TEST_F(RequestCommandsTest, DescribeReadsTheInputForADash) {
  EXPECT_EQ(sent({"describe", "Vistel", "routes", "-", "--time", "1.5"}, "a\nb\n"),
            request(R"(3, "description": "routes", "logString": "a\nb\n", "sender": "lirractl", )"
                    R"("sessionType": "Vistel", "time": 1.5)"));
  EXPECT_EQ(
      sent({"describe", "Vistel", "routes", "--time", "1.5"}),
      request(R"(3, "description": "routes", "sender": "lirractl", "sessionType": "Vistel", "time": 1.5)"));
}

TEST_F(RequestCommandsTest, InfoAndQualityHaveTheirKeys) {
  EXPECT_EQ(
      sent({"info", "Vistel", "Codec", "opus"}),
      request(R"(4, "callInfo": "opus", "category": "Codec", "sender": "lirractl", "session": "Vistel")"));
  EXPECT_EQ(
      sent({"quality", "Vistel", "audio", "gaps"}),
      request(
          R"(5, "description": "audio", "logString": "gaps", "sender": "lirractl", "session": "Vistel")"));
}

TEST_F(RequestCommandsTest, MetricKeepsTheKindThatTheNumberLooksLike) {
  const auto metric = [](const std::string& number) {
    return request(R"(6, "description": "m", "number": <)" + number +
                   R"(>, "sender": "lirractl", "session": "T")");
  };
  EXPECT_EQ(sent({"metric", "T", "m", "-3"}), metric("-3"));
  EXPECT_EQ(sent({"metric", "T", "m", "-3.5"}), metric("-3.5"));
  EXPECT_EQ(sent({"metric", "T", "m", "18446744073709551615"}), metric("18446744073709551615u"));
  EXPECT_EQ(sent({"metric", "T", "m", "7", "--kind", "uint"}), metric("7u"));
}

TEST_F(RequestCommandsTest, MetricThatIsNoNumberIsWrongUsage) {
  EXPECT_EQ(run({"metric", "T", "m", "7x"}), 2);
  EXPECT_EQ(run({"metric", "T", "m", "-7", "--kind", "uint"}), 2);
  EXPECT_EQ(err,
            "lirractl: \"-7\" is no number of that kind\n"
            "  Give a number such as 41.5, and --kind int, uint or real only to force one.\n");
  EXPECT_TRUE(agent->requests().empty());
}

TEST_F(RequestCommandsTest, FileBecomesAbsoluteAndMustBeThere) {
  writeFile(directory / "a.pcap", "x");
  EXPECT_EQ(
      plain(sent({"file", "Vistel", "a.pcap", "--category", "Media"})),
      request(
          R"(14, "category": "Media", "path": "ROOT/a.pcap", "sender": "lirractl", "session": "Vistel")"));
  EXPECT_EQ(plain(sent({"file", "Vistel", "a.pcap"})),
            request(R"(14, "path": "ROOT/a.pcap", "sender": "lirractl", "session": "Vistel")"));
  EXPECT_EQ(run({"file", "Vistel", "missing"}), 3);
  EXPECT_EQ(plain(err),
            "lirractl: there is no file ROOT/missing\n  The agent takes the file when the session ends.\n");
}

TEST_F(RequestCommandsTest, IdentitiesAndFailureAreSet) {
  EXPECT_EQ(sent({"initiator", "T", "+1"}),
            request(R"(11, "initiator": "+1", "sender": "lirractl", "session": "T")"));
  EXPECT_EQ(sent({"receiver", "T", "+2"}),
            request(R"(12, "receiver": "+2", "sender": "lirractl", "session": "T")"));
  EXPECT_EQ(sent({"failure", "T", "no route"}),
            request(R"(13, "failureReason": "no route", "sender": "lirractl", "session": "T")"));
}

TEST_F(RequestCommandsTest, RecordsLeaveOutWhatWasNotGiven) {
  EXPECT_EQ(sent({"log", "up"}),
            request(R"(15, "level": 0, "logString": "up", "sender": "lirractl", "time": 0u)"));
  EXPECT_EQ(
      sent({"event", "-", "--type", "T", "--category", "C", "--level", "3", "--time", "9"}, "up"),
      request(
          R"(16, "category": "C", "eventString": "up", "level": 3, "sender": "lirractl", "time": 9u, "type": "T")"));
}

TEST_F(RequestCommandsTest, GlobalOptionsMayStandBeforeAndAfterTheCommand) {
  EXPECT_EQ(sent({"--sender", "me", "pulse", "T"}), request(R"(7, "sender": "me", "session": "T")"));
  EXPECT_EQ(sent({"pulse", "T", "--sender", "me"}), request(R"(7, "sender": "me", "session": "T")"));
}

TEST_F(RequestCommandsTest, TextWithADashGoesAfterTwoOfThem) {
  EXPECT_EQ(sent({"failure", "T", "--", "--help"}),
            request(R"(13, "failureReason": "--help", "sender": "lirractl", "session": "T")"));
}

TEST_F(RequestCommandsTest, JsonSaysDone) {
  EXPECT_EQ(run({"pulse", "T", "--json"}), 0);
  EXPECT_EQ(out, "{\"result\": \"done\"}\n");
}

TEST_F(RequestCommandsTest, AgentThatDoesNotConfirmIsAnError) {
  agent->behave({ScriptedAgent::Behaviour{.answersBarriers = false}});
  EXPECT_EQ(run({"pulse", "T", "--timeout", "0.05"}), 1);
  EXPECT_EQ(err,
            "lirractl: the agent did not confirm within 0.05 s\n"
            "  It may be busy: try a longer --timeout, and see what \"lirractl status\" says.\n");
}

TEST_F(RequestCommandsTest, AgentThatTurnsThisUserAwayIsAnError) {
  agent->behave({ScriptedAgent::Behaviour{.diesAfterBytes = 1}});
  EXPECT_EQ(run({"pulse", "T"}), 1);
  EXPECT_EQ(err,
            "lirractl: the agent closed the connection before it confirmed\n"
            "  It lets in its own user, the superuser and the group that ipc.group in lirra.toml names; its "
            "own log "
            "says whom it turned away.\n");
}

class RequestsWithoutAgentTest : public ToolFixture {};

TEST_F(RequestsWithoutAgentTest, AgentThatIsNotRunningIsAnErrorThatSaysHowToStartIt) {
  EXPECT_EQ(run({"pulse", "T", "--json"}), 1);
  const std::string trouble = "the agent is not running: ROOT/agent: No such file or directory";
  EXPECT_EQ(plain(err), "lirractl: " + trouble +
                            "\n  Start it with \"zalloggingagent &\" or \"systemctl --user start "
                            "zalloggingagent.socket\"; another socket is named with --socket.\n");
  EXPECT_EQ(plain(out), R"({"result": "failed", "exitCode": 1, "trouble": ")" + trouble +
                            R"(", "hint": "Start it with \"zalloggingagent &\" or \"systemctl --user start )"
                            "zalloggingagent.socket\\\"; another socket is named with --socket.\"}\n");
}

TEST_F(RequestsWithoutAgentTest, UnknownPlaceIsAnErrorThatSaysHowToNameOne) {
  machine.toolSettings.socketPath.clear();
  EXPECT_EQ(run({"pulse", "T"}), 1);
  EXPECT_EQ(err,
            "lirractl: it is not known where the agent listens\n"
            "  Set XDG_RUNTIME_DIR or LIRRA_SOCKET, or name the socket with --socket.\n");
}

TEST_F(RequestsWithoutAgentTest, WaitLooksAgainUntilTheAgentIsThere) {
  machine.onPause = [this] {
    if (machine.pauses == 3) startAgent();
  };
  EXPECT_EQ(run({"pulse", "T", "--wait"}), 0);
  EXPECT_EQ(machine.pauses, 3);
}

TEST_F(RequestsWithoutAgentTest, WaitEndsWithTheTimeout) {
  EXPECT_EQ(run({"pulse", "T", "--wait", "--timeout", "0.1"}), 1);
  EXPECT_EQ(machine.pauses, 4) << "every 20 of 100 milliseconds, and not after the last look";
}

}  // namespace
}  // namespace zal::testing
