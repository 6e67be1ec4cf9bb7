#include <thread>

#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using State = DumpView::State;

/// A dump as the agent would make it: at each look of the tool the next of `events` happens.
class DumpCommandTest : public ToolFixture {
 protected:
  DumpCommandTest() {
    startAgent();
    machine.onPause = [this] {
      if (!events.empty()) {
        events.front()();
        events.erase(events.begin());
      }
      std::this_thread::sleep_for(1ms);  // the client's own thread takes what comes
    };
  }
  /// What the agent records: so many steps begun, each a second after the one before.
  void record(std::size_t begun, State state = State::running, std::vector<DumpView::Missing> missing = {}) {
    DumpView dump;
    dump.name = "1-1.progress";
    dump.service = "Vistel";
    dump.directory = directory / "Reports/Vistel/Vistel-Log (now)";
    dump.steps = {{"Network state", {}}, {"Archive", {}}};
    for (std::size_t i = 0; i < begun; ++i) dump.steps[i].began = 1s * i;
    dump.currentStep = begun;
    dump.state = state;
    dump.missing = std::move(missing);
    dump.reason = state == State::failed ? "no archive was made" : "";
    machine.recordedDumps = {dump};
  }
  void reply() {
    writeFile(archive, std::string(1536, 'z'));
    ValueMap result;
    result["logPath"] = Value(archive);
    result["replyAction"] = Value(std::int64_t{14});
    agent->reply({{"action", Value(std::int64_t{14})}, {"replyResult", Value(std::move(result))}});
  }
  void postPrompt(const std::string& state = "waiting", const std::string& answer = "") {
    PostedAlert prompt;
    prompt.id = "3";
    prompt.title = "Vistel Logging (lirractl 4711)";
    prompt.buttons = {{"default", "OK"}, {"alternate", "Cancel"}};
    prompt.takesText = true;
    prompt.state = state;
    prompt.answer = answer;
    PostedAlert other = prompt;
    other.id = "2";
    other.title = "Vistel Logging";
    machine.postedAlerts = {other, prompt};
  }
  std::string onlyRequest() {
    const auto requests = agent->requests();
    return requests.size() == 1 ? requests[0] : std::to_string(requests.size()) + " requests";
  }
  static std::string dumpRequest(const std::string& info) {
    return R"({"__ipc__event_code__": 9, "action": 14, "sender": "lirractl", "session": "Vistel", "userInfo": {)" +
           info + "}}";
  }

  const std::string archive = directory / "Reports/Vistel/Vistel-Log (now).zip";
  std::vector<std::function<void()>> events;
};

TEST_F(DumpCommandTest, ProgressIsShownAndThenTheArchive) {
  events = {[&] { record(1); },
            [&] {
              record(1, State::running, {{"stackshot", "no service"}});
            },
            [&] {
              record(2, State::done, {{"stackshot", "no service"}});
            },
            [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel", "--no-prompt"}), 0);
  EXPECT_EQ(plain(out),
            "    0:00  step 1 of 2: Network state\n"
            "          missing: stackshot: no service\n"
            "    0:01  step 2 of 2: Archive\n"
            "ROOT/Reports/Vistel/Vistel-Log (now).zip (1.5 KiB)\n");
  EXPECT_EQ(err, "");
  EXPECT_EQ(onlyRequest(), dumpRequest(R"("collectionFlags": 127, "displayFlags": 4)"));
}

TEST_F(DumpCommandTest, OnATerminalTheStepThatRunsIsRedrawn) {
  machine.terminal = true;
  events = {[&] { record(1); },
            [&] {
              record(2, State::done);
              reply();
            }};
  EXPECT_EQ(run({"dump", "Vistel", "--no-prompt"}), 0);
  EXPECT_TRUE(
      plain(out).starts_with("\r\x1b[K    0:00  the agent begins"
                             "\r\x1b[K    0:00  step 1 of 2: Network state"
                             "\r\x1b[K    0:00  step 1 of 2: Network state\n"
                             "    0:01  step 2 of 2: Archive\n"))
      << out;
  EXPECT_TRUE(plain(out).ends_with("\nROOT/Reports/Vistel/Vistel-Log (now).zip (1.5 KiB)\n")) << out;
}

TEST_F(DumpCommandTest, DescriptionAnswersTheToolsOwnPrompt) {
  events = {[&] { postPrompt(); }, [&] {}, [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel", "--description", "no sound", "--flags", "0x5F"}), 0);
  EXPECT_EQ(machine.answers, std::vector<std::string>{"3 default \"no sound\""});
  EXPECT_EQ(onlyRequest(),
            dumpRequest(
                R"-("collectionFlags": 95, "displayFlags": 1, "title": "Vistel Logging (lirractl 4711)")-"));
}

TEST_F(DumpCommandTest, OnATerminalThePersonIsAsked) {
  machine.terminal = true;
  events = {[&] { postPrompt(); }, [&] {}, [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel"}, "no sound\n"), 0);
  EXPECT_TRUE(out.starts_with("Please describe the problem briefly: ")) << out;
  EXPECT_EQ(machine.answers, std::vector<std::string>{"3 default \"no sound\""});
}

TEST_F(DumpCommandTest, WithoutATerminalNobodyIsAsked) {
  events = {[&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel"}, "no sound\n"), 0);
  EXPECT_EQ(onlyRequest(), dumpRequest(R"("collectionFlags": 127, "displayFlags": 4)"));
}

TEST_F(DumpCommandTest, PromptThatSomebodyElseCancelledEndsIt) {
  events = {[&] { postPrompt("answered", "alternate"); }};
  EXPECT_EQ(run({"dump", "Vistel", "--description", "no sound"}), 5);
  EXPECT_EQ(err, "lirractl: the dump's prompt was cancelled\n  The agent's own log may say more.\n");
  EXPECT_TRUE(machine.answers.empty());
}

TEST_F(DumpCommandTest, DescriptionThatCannotBeGivenEndsIt) {
  machine.answerTrouble = "it cannot be written";
  events = {[&] { postPrompt(); }};
  EXPECT_EQ(run({"dump", "Vistel", "--description", "no sound"}), 5);
  EXPECT_EQ(err,
            "lirractl: the description could not be given: it cannot be written\n"
            "  The agent's own log may say more.\n");
}

TEST_F(DumpCommandTest, ForProgramsItIsOneObjectAtTheEnd) {
  events = {[&] { record(2, State::done, {{"stackshot", "no service"}}); }, [&] {}, [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel", "--json"}), 0);
  const std::string beginning =
      R"({"result": "done", "archive": "ROOT/Reports/Vistel/Vistel-Log (now).zip", "bytes": 1536, "milliseconds": )";
  const std::string end = R"(, "missing": [{"what": "stackshot", "why": "no service"}]})"
                          "\n";
  EXPECT_TRUE(plain(out).starts_with(beginning) && out.ends_with(end)) << out;
}

TEST_F(DumpCommandTest, EarlierDumpsAndSessionEndsAreNotShown) {
  record(1);
  events = {[&] {
              machine.recordedDumps.push_back(machine.recordedDumps[0]);
              machine.recordedDumps[1].name = "2-1.progress";
              machine.recordedDumps[1].directory = "/r/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)";
            },
            [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel"}), 0);
  EXPECT_EQ(plain(out), "ROOT/Reports/Vistel/Vistel-Log (now).zip (1.5 KiB)\n");
}

TEST_F(DumpCommandTest, AgentThatEndsMeanwhileIsAnErrorOfItsOwn) {
  events = {[&] { record(1); }, [&] { agent->closeConnections(); }};
  EXPECT_EQ(run({"dump", "Vistel"}), 5);
  EXPECT_EQ(plain(err),
            "lirractl: the agent ended before the dump was done\n"
            "  What was gathered lies in ROOT/Reports/Vistel/Vistel-Log (now) or beside it.\n");
}

TEST_F(DumpCommandTest, DumpThatWasCutOffWithoutAWordIsAnErrorFiveSecondsLater) {
  events = {[&] { record(1, State::cutOff); }};
  EXPECT_EQ(run({"dump", "Vistel"}), 5);
  EXPECT_EQ(plain(err),
            "lirractl: the dump was cut off\n"
            "  What was gathered lies in ROOT/Reports/Vistel/Vistel-Log (now) or beside it.\n");
  EXPECT_EQ(machine.pauses, 51) << "every tenth of a second";
}

TEST_F(DumpCommandTest, DumpThatMadeNoArchiveIsAnErrorAlthoughTheAgentReplies) {
  events = {[&] { record(2, State::failed); }, [&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel"}), 5);
  EXPECT_EQ(plain(err),
            "lirractl: the dump failed: no archive was made\n"
            "  What was gathered lies in ROOT/Reports/Vistel/Vistel-Log (now) or beside it.\n");
}

TEST_F(DumpCommandTest, ReplyWithoutAPathIsAnError) {
  events = {[&] { agent->reply({{"action", Value(std::int64_t{14})}}); }};
  EXPECT_EQ(run({"dump", "Vistel", "--json"}), 5);
  EXPECT_EQ(err, "lirractl: the agent made no archive\n  The agent's own log may say more.\n");
  EXPECT_EQ(out, R"({"result": "failed", "exitCode": 5, "trouble": "the agent made no archive", )"
                 R"("hint": "The agent's own log may say more."})"
                 "\n");
}

TEST_F(DumpCommandTest, WithoutAReplyItEndsWithTheTimeout) {
  EXPECT_EQ(run({"dump", "Vistel", "--timeout", "1"}), 1);
  EXPECT_EQ(
      err,
      "lirractl: the agent has not replied in time\n"
      "  It goes on without this command; a longer --timeout waits longer. It may wait for an answer: see "
      "\"lirractl alerts\".\n");
  EXPECT_EQ(machine.pauses, 10);
}

TEST_F(DumpCommandTest, UsualTimeoutIsTenMinutes) {
  machine.onPause = [] {};
  EXPECT_EQ(run({"dump", "Vistel"}), 1);
  EXPECT_EQ(machine.pauses, 6000);
}

TEST_F(DumpCommandTest, AgentThatIsBusyTakesTheRequestLater) {
  agent->behave({ScriptedAgent::Behaviour{.answersBarriers = false}});
  events = {[&] { reply(); }};
  EXPECT_EQ(run({"dump", "Vistel"}), 0) << err;
}

TEST_F(DumpCommandTest, WrongUsageSendsNothing) {
  EXPECT_EQ(run({"dump"}), 2);
  EXPECT_EQ(run({"dump", ""}), 2);
  EXPECT_EQ(run({"dump", "Vistel", "--description", "x", "--no-prompt"}), 2);
  EXPECT_EQ(run({"dump", "Vistel", "--flags", "all"}), 2);
  EXPECT_EQ(err, "lirractl: \"all\" is no set of flags\n  Give a number such as 95 or 0x5F.\n");
  EXPECT_TRUE(agent->requests().empty());
}

class DumpWithoutAgentTest : public ToolFixture {};

TEST_F(DumpWithoutAgentTest, MissingAgentIsToldAtOnce) {
  EXPECT_EQ(run({"dump", "Vistel"}), 1);
  EXPECT_EQ(plain(err),
            "lirractl: the agent is not running: ROOT/agent: No such file or directory\n"
            "  Start it with \"zalloggingagent &\" or \"systemctl --user start zalloggingagent.socket\"; "
            "another socket is named with --socket.\n");
  EXPECT_EQ(machine.pauses, 0);
}

TEST_F(DumpWithoutAgentTest, WaitLooksAgainUntilTheAgentIsThere) {
  machine.onPause = [this] {
    if (machine.pauses == 3) startAgent();
    if (machine.pauses > 3) {
      ASSERT_TRUE(agent->waitForRequests(1));
      agent->reply({});
      std::this_thread::sleep_for(1ms);
    }
  };
  EXPECT_EQ(run({"--wait", "dump", "Vistel"}), 5) << "a reply without a path";
  EXPECT_EQ(err, "lirractl: the agent made no archive\n  The agent's own log may say more.\n");
}

TEST_F(DumpWithoutAgentTest, UnknownPlaceIsToldAsSuch) {
  machine.toolSettings.socketPath.clear();
  EXPECT_EQ(run({"dump", "Vistel"}), 1);
  EXPECT_EQ(err,
            "lirractl: it is not known where the agent listens\n"
            "  Set XDG_RUNTIME_DIR or LIRRA_SOCKET, or name the socket with --socket.\n");
}

}  // namespace
}  // namespace zal::testing
