#include <iterator>

#include "tests/crash_points/aftermath.h"
#include "tests/crash_points/expected_texts.h"
#include "tests/crash_points/scenario.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// Everything that a client can say of a call, a barrier after each, and its end.
class Call : public Scenario {
 public:
  void prepare(AgentSandbox& sandbox) const override {
    sandbox.settings = "[testing]\nclosingStageDelay = 0.001\ndelayedEnd = 0.001\n[bus]\nenabled = false\n";
    sandbox.logSettings += "rotationSize = 1024\n";  // several times within one call
    writeFile(sandbox / kGatheredFile, kGatheredText);
    writeFile(sandbox / kFarFile, kGatheredText);
  }

  void play(const AgentSandbox& sandbox, PlayedClient& client, Told& told) const override {
    client.tell([](MessageBuilder& message) {
      begin(message, 0, "sessionType");
      message.setInt64("beginSessionFlags", 4);
    });
    for (int number = 0; number < kEntries; ++number) {
      told.entries.insert(number);
      if (client.tell([=](MessageBuilder& message) {
            begin(message, 3, "sessionType");
            message.setString("logString", entryText(number));
            message.setReal("time", kFirstMoment + number);
          }))
        told.confirmedEntries.insert(number);
      if (number % 5 == 0) _tellHeader(client, told, number / 5);
      if (number % 3 == 0) tellRecord(client, told, number);
    }
    for (const char* const file : {kGatheredFile, kFarFile}) {
      client.tell([&](MessageBuilder& message) {
        begin(message, 14, "session");
        message.setString("category", "Gathered");
        message.setString("path", sandbox / file);
      });
    }
    for (int attempt = 0; attempt < 3 && !told.endIsConfirmed; ++attempt) {
      told.endIsConfirmed = client.tell([](MessageBuilder& message) { begin(message, 1, "sessionType"); });
    }
    waitForArchive(sandbox, client);
  }

  void check(Aftermath& after, const Told& told) const override {
    after.checkSession(told);
    after.checkLogSet(told);
    after.checkGatheredFile(kGatheredFile, 1);
    // The copy has its name before the source goes; who is cut off in between finds the source again.
    after.checkGatheredFile(kFarFile, 2);
  }

 private:
  static constexpr int kEntries = 30;

  static void begin(MessageBuilder& message, std::int64_t code, const char* typeKey) {
    message.setInt64("__ipc__event_code__", code);
    message.setString(typeKey, kSessionType);
    message.setString("sender", "test");
  }

  static void _tellHeader(PlayedClient& client, Told& told, int number) {
    struct Row {
      std::int64_t code;
      const char* key;
      const char* value;
      const char* line;
    };
    static constexpr Row rows[] = {
        {11, "initiator", "ann@example.org", "[Initiator ID: ann@example.org]"},
        {12, "receiver", "bob@example.org", "[Recipient ID: bob@example.org]"},
        {13, "failureReason", "network lost", "[Failure Reason: network lost]"},
        {4, "callInfo", "opus", "[Codec: opus]"},
        {2, "checkpoint", "Connected", "[Sender: test] Connected   ["},
    };
    if (number >= static_cast<int>(std::size(rows))) return;
    const Row& row = rows[number];
    if (client.tell([&](MessageBuilder& message) {
          begin(message, row.code, "session");
          message.setString(row.key, row.value);
          if (row.code == 4) message.setString("category", "Codec");
          if (row.code == 2) message.setReal("time", kFirstMoment);
        }))
      told.confirmedHeaders.insert(row.line);
  }
};

}  // namespace

std::unique_ptr<Scenario> makeCallScenario() { return std::make_unique<Call>(); }

}  // namespace zal::testing
