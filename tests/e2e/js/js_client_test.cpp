#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>

#include "tests/linux/ipc/ipc_fixture.h"

extern char** environ;

namespace zal {
namespace {

using Lines = std::vector<std::string>;

constexpr int kNotHere = 77;

pid_t start(const std::string& commandLine, const std::string& output) {
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
  posix_spawn_file_actions_adddup2(&actions, 1, 2);
  std::string shell = "sh";
  std::string option = "-c";
  std::string line = commandLine;
  char* arguments[] = {shell.data(), option.data(), line.data(), nullptr};
  pid_t child = -1;
  EXPECT_EQ(::posix_spawn(&child, "/bin/sh", &actions, nullptr, arguments, environ), 0);
  posix_spawn_file_actions_destroy(&actions);
  return child;
}

/// A client in another language, made from the protocol's page alone, against the real service.
class JavaScriptClientTest : public IpcFixture {
 protected:
  /// The exit status, the loop running meanwhile.
  int run(const std::string& commandLine) {
    const pid_t child = start(commandLine, directory / "output");
    int status = 0;
    const bool ended =
        runUntil([&] { return ::waitpid(child, &status, WNOHANG) == child; }, std::chrono::seconds(60));
    if (!ended) {
      ::kill(child, SIGKILL);
      ::waitpid(child, &status, 0);
    }
    return ended && WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }
  std::string output() const { return testing::readFile(directory / "output"); }

  /// What the agent's request handler would be given.
  void keepDescriptions() {
    onEvent = [this](const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
      const auto* const* message = std::get_if<const Message*>(&event);
      descriptions.push_back(message != nullptr ? (*message)->description() : described(event));
      if (message == nullptr) return;
      if ((*message)->int64("__ipc__event_code__") == 9) userInfo = (*message)->dictionary("userInfo");
      if (const auto token = (*message)->replyToken()) {
        EXPECT_TRUE(peer->sendReply(
            *token, {{"action", Value(std::int64_t{14})},
                     {"replyResult", Value(ValueMap{{"logPath", Value(std::string("/dump.zip"))},
                                                    {"replyAction", Value(std::int64_t{14})}})}}));
      }
    };
  }

  Lines descriptions;
  std::optional<ValueMap> userInfo;
};

TEST_F(JavaScriptClientTest, SendsEveryRequestWaitsBehindABarrierAndReadsAReply) {
  const int prepared = run(ZAL_JS_SOURCE "/prepare " ZAL_JS_DIRECTORY);
  if (prepared == kNotHere) GTEST_SKIP() << output();
  ASSERT_EQ(prepared, 0) << output();
  startService();
  keepDescriptions();

  ASSERT_EQ(run("exec node " ZAL_JS_DIRECTORY "/client.mjs " + path), 0) << output();
  ASSERT_TRUE(runUntil([this] { return !descriptions.empty() && descriptions.back() == "invalid"; }));

  EXPECT_EQ(output(),
            "barrier passed\n"
            "{\"action\":14,\"replyResult\":{\"logPath\":\"/dump.zip\",\"replyAction\":14}}\n");
  EXPECT_GE(flushes, 1);
  const Lines expected{
      R"({"__ipc__event_code__": 0, "beginSessionFlags": 4, "endSessionFlags": -1, "sender": "js", "sessionType": "Vistel"})",
      R"({"__ipc__event_code__": 1, "sender": "js", "sessionType": "Vistel"})",
      R"({"__ipc__event_code__": 2, "checkpoint": "Grüße €𝄞", "sender": "js", "session": "Vistel", "time": 1700000000.25})",
      R"({"__ipc__event_code__": 3, "description": "two lines", "logString": "first\nsecond", "sender": "js", "sessionType": "Vistel", "time": 100.5})",
      R"({"__ipc__event_code__": 4, "callInfo": ")" + std::string(1023, 'x') +
          R"("… (70000 bytes), "category": "Codec", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 5, "description": "q", "logString": "good", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 6, "description": "rtt", "number": <4.5>, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 6, "description": "lost", "number": <7u>, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 6, "description": "drift", "number": <-3>, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 7, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 8, "action": 3, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 9, "action": 15, "sender": "js", "session": "Vistel", "userInfo": {"inner": {"deep": "x"}, )"
      R"("mixed": [1, "b"], "names": ["a", "b"], "none": null, "ratio": 0.5, "retries": 3, "title": "T", "useWifi": true}})",
      R"({"__ipc__event_code__": 10, "event": 1, "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 11, "initiator": "alice", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 12, "receiver": "bob", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 13, "failureReason": "busy", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 14, "category": "Codec", "path": "/tmp/a.log", "sender": "js", "session": "Vistel"})",
      R"({"__ipc__event_code__": 15, "category": "c", "level": 6, "logString": "a record", "sender": "js", "time": 18446744073709551615u, "type": "Js"})",
      R"({"__ipc__event_code__": 16, "category": "", "eventString": "an event", "level": -7, "sender": "js", "time": 0u, "type": "Js"})",
      R"({"__ipc__event_code__": 8, "action": 14, "sender": "js", "session": "Vistel"})",
      "invalid"};
  EXPECT_EQ(descriptions, expected);
  const ValueMap expectedInfo{{"useWifi", Value(true)},
                              {"title", Value(std::string("T"))},
                              {"retries", Value(std::int64_t{3})},
                              {"ratio", Value(0.5)},
                              {"none", Value()},
                              {"names", Value(ValueList{Value(std::string("a")), Value(std::string("b"))})},
                              {"mixed", Value(ValueList{Value(std::int64_t{1}), Value(std::string("b"))})},
                              {"inner", Value(ValueMap{{"deep", Value(std::string("x"))}})}};
  EXPECT_EQ(userInfo, expectedInfo);
}

}  // namespace
}  // namespace zal
