#include <cmath>
#include <set>
#include <sstream>

#include "dump/service_collection.h"
#include "tests/dump/collection_fixture.h"
#include "tests/dump/prepared_host.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

struct Golden {
  const char* name;
  const char* service;
  CollectionFlags flags;
};

// The first three are what clients ask for; then everything, and each bit by itself, for a service that adds
// nothing.
constexpr Golden kGoldens[] = {
    {"vistel_0", "Vistel", 0},
    {"vistel_5f", "Vistel", 0x5F},
    {"vistel_7f", "Vistel", 0x7F},
    {"vistel_everything", "Vistel", 0x3F8FF},
    {"bit_00001_push_logs", "Quillet", 0x00001},
    {"bit_00002_network", "Quillet", 0x00002},
    {"bit_00004_baseband", "Quillet", 0x00004},
    {"bit_00008_system_logs", "Quillet", 0x00008},
    {"bit_00010_registration", "Quillet", 0x00010},
    {"bit_00020_stackshot", "Quillet", 0x00020},
    {"bit_00040_pings", "Quillet", 0x00040},
    {"bit_00080_identity", "Quillet", 0x00080},
    {"bit_00800_proximity", "Quillet", 0x00800},
    {"bit_01000_handover", "Quillet", 0x01000},
    {"bit_02000_video_calls", "Quillet", 0x02000},
    {"bit_04000_media", "Quillet", 0x04000},
    {"bit_08000_location", "Quillet", 0x08000},
    {"bit_10000_cloud_sync", "Quillet", 0x10000},
    {"bit_20000_prediction", "Quillet", 0x20000},
};

/// Everything that a collection of these flags leaves in its directory just before it becomes an
/// archive, and everything that it starts, in order, on one prepared host.
class CollectionGoldenTest : public testing::CollectionFixture, public ::testing::WithParamInterface<Golden> {
 protected:
  CollectionGoldenTest() {
    prepareHost(host);
    host.fileCopier.holdsBack = true;
  }

  [[nodiscard]] std::string collected(const Golden& golden, bool usesQueues = false) {
    ServiceCollection collection{
        {.platform = host.platform, .collectors = collectors, .closing = closing, .usesQueues = usesQueues}};
    collection.CollectServiceLogs({.service = golden.service,
                                   .destination = host.home / "dump",
                                   .reason = {},
                                   .background = false,
                                   .flags = golden.flags});
    host.queues.runAll();
    advance(8s);
    EXPECT_EQ(host.fileCopier.started.size(), 1U);
    std::string text = "TREE\n" + testing::listTree(host.home / "dump");
    text += "\nCOMMANDS\n";
    for (const std::string& line : host.shell.commands) text += line + "\n";
    text += "\nPINGS\n" + pings();
    return withHomeNamed(text);
  }

 private:
  std::string pings() {
    std::string text;
    for (const auto& test : host.pings.tests) {
      text += test->address + (test->wifi ? " over Wi-Fi" : " over cellular") + " for " +
              std::to_string(std::lround(test->seconds)) + " s";
      test->finish("done", true);
      host.queues.runAll();
      for (const std::string& path : test->written) text += " into " + path;
      text += "\n";
    }
    return text;
  }
  std::string withHomeNamed(std::string text) const {
    const std::string& home = host.home.path();
    for (std::size_t at = text.find(home); at != std::string::npos; at = text.find(home, at)) {
      text.replace(at, home.size(), "$HOME");
    }
    return text;
  }
};

/// With its lines sorted: jobs of several queues mix as they come.
std::string sortedLines(const std::string& text) {
  std::multiset<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) lines.insert(line);
  std::string sorted;
  for (const std::string& line : lines) sorted += line + "\n";
  return sorted;
}

TEST_P(CollectionGoldenTest, MakesExactlyThisTreeAndStartsExactlyTheseCommands) {
  const std::string name = std::string(GetParam().name) + ".txt";
  const std::string actual = collected(GetParam());
  // Kept beside the build, to be compared and, once read, taken over.
  testing::writeFile(std::string(ZAL_DUMP_GOLDEN_ACTUAL) + "/" + name, actual);
  EXPECT_EQ(actual, testing::readFile(std::string(ZAL_DUMP_GOLDEN) + "/" + name));
}

TEST_P(CollectionGoldenTest, MakesTheSameFromQueues) {
  const std::string golden = testing::readFile(std::string(ZAL_DUMP_GOLDEN) + "/" + GetParam().name + ".txt");
  EXPECT_EQ(sortedLines(collected(GetParam(), true)), sortedLines(golden));
}

INSTANTIATE_TEST_SUITE_P(Flags, CollectionGoldenTest, ::testing::ValuesIn(kGoldens),
                         [](const auto& golden) { return std::string(golden.param.name); });

}  // namespace
}  // namespace zal
