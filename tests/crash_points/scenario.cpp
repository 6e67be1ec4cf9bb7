#include "tests/crash_points/scenario.h"

#include "platform/linux/progress/progress_file.h"
#include "tests/crash_points/expected_texts.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

void tellRecord(PlayedClient& client, Told& told, int number) {
  told.records.insert(number);
  const bool isConfirmed = client.tell([=](MessageBuilder& message) {
    message.setInt64("__ipc__event_code__", 15);
    message.setString("logString", recordText(number) + std::string(200, 'x'));
    message.setString("sender", "test");
    message.setString("category", "crash");
    message.setString("type", kSessionType);
  });
  if (isConfirmed) told.confirmedRecords.insert(number);
}

namespace {

bool isCollectionOver(const AgentSandbox& sandbox) {
  for (const ListedDumpProgress& listed : listDumpProgress(progressDirectory(sandbox / "runtime"))) {
    if (listed.record.state != DumpProgressRecord::State::running) return true;
  }
  // Where the record itself failed.
  return readFile(sandbox.outputFile()).find("Done zipping log") != std::string::npos;
}

}  // namespace

void waitForArchive(const AgentSandbox& sandbox, PlayedClient& client) {
  client.waitUntil([&] { return isCollectionOver(sandbox); });
  client.tell([](MessageBuilder& message) { message.setInt64("__ipc__event_code__", 10); });
}

std::unique_ptr<Scenario> Scenario::named(const std::string& name) {
  if (name == "call") return makeCallScenario();
  if (name == "dump") return makeDumpScenario();
  return nullptr;
}

}  // namespace zal::testing
