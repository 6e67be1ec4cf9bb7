#include "platform/value.h"
#include "tests/crash_points/aftermath.h"
#include "tests/crash_points/expected_texts.h"
#include "tests/crash_points/scenario.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// A dump that links, copies and runs commands, while log records come in.
class Dump : public Scenario {
 public:
  void prepare(AgentSandbox& sandbox) const override {
    sandbox.settings = "[testing]\nclosingStageDelay = 0.02\n[bus]\nenabled = false\n";
    sandbox.logSettings += "rotationSize = 1024\n";
    for (const char* row :
         {"registration.zaltool-list", "registration.nexatool-list", "registration.zaltool-info",
          "registration.nexad-info", "registration.nexatool-skypairing-devices",
          "registration.nexatool-quillet-devices", "registration.nexad-info-again", "registration.le-devices",
          "system.vaultq-inet", "system.vaultq-keys", "system.vaultq-cert", "system.syslog"}) {
      sandbox.commandSettings += std::string("\"") + row + "\" = 'echo what it says'\n";
    }
    for (const Source& source : kSources) writeFile(sandbox / source.path, source.text);
  }

  void play(const AgentSandbox& sandbox, PlayedClient& client, Told& told) const override {
    for (int number = 0; number < kRecords / 2; ++number) tellRecord(client, told, number);
    for (int attempt = 0; attempt < 3 && !told.endIsConfirmed; ++attempt) {
      told.endIsConfirmed = client.tell([](MessageBuilder& message) {
        message.setInt64("__ipc__event_code__", 9);
        message.setInt64("action", 14);
        message.setString("session", kSessionType);
        message.setString("sender", "test");
        message.setDictionary("userInfo",
                              {{"collectionFlags", Value(kFlags)}, {"displayFlags", Value(kQuiet)}});
      });
    }
    for (int number = kRecords / 2; number < kRecords; ++number) tellRecord(client, told, number);
    waitForArchive(sandbox, client);
  }

  void check(Aftermath& after, const Told& told) const override {
    after.checkLogSet(told);
    for (const Source& source : kSources) after.checkSource(source.path, source.text);
  }

 private:
  struct Source {
    const char* path;
    const char* text;
  };
  static constexpr Source kSources[] = {
      {"state/Reports/Vistel_crash.txt", "a crash report"},
      {"location/tracks/track.log", "where the device was"},
      {"location/fix.log", "where it is"},
      {"state/Logs/Registration/Registration.log", "who is registered"},
  };
  static constexpr int kRecords = 8;
  /// System logs, registration, video calls, location.
  static constexpr std::int64_t kFlags = 0xA018;
  static constexpr std::int64_t kQuiet = 4;
};

}  // namespace

std::unique_ptr<Scenario> makeDumpScenario() { return std::make_unique<Dump>(); }

}  // namespace zal::testing
