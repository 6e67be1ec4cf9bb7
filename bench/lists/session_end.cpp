#include "bench/lists/session_end.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>

#include "bench/support/timing.h"
#include "collectors/command_runner.h"
#include "collectors/file_collector.h"
#include "collectors/ping_runner.h"
#include "session/vistel_session.h"
#include "tests/support/fake_platform.h"

namespace zal::bench {
namespace {

constexpr std::size_t kWriteSize = 1U << 20U;

[[noreturn]] void fail(const char* what) {
  perror(what);
  exit(1);
}

double secondsToWrite(const std::filesystem::path& path, const std::string& bytes) {
  const Stopwatch watch;
  const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  if (file < 0) fail(path.c_str());
  for (std::size_t at = 0; at < bytes.size(); at += kWriteSize) {
    const std::size_t part = std::min(kWriteSize, bytes.size() - at);
    if (write(file, bytes.data() + at, part) != static_cast<ssize_t>(part)) fail(path.c_str());
  }
  close(file);
  return watch.seconds();
}

// What the session wrote, as one text. The files are removed.
std::string takeFiles(const std::filesystem::path& base, std::uint64_t atLeastLines) {
  std::string all;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(base)) {
    if (!entry.is_regular_file()) continue;
    std::ifstream file(entry.path(), std::ios::binary);
    all.append(std::istreambuf_iterator<char>(file), {});
  }
  std::filesystem::remove_all(base);
  if (static_cast<std::uint64_t>(std::count(all.begin(), all.end(), '\n')) < atLeastLines) {
    fprintf(stderr, "the session's files lack lines\n");
    exit(1);
  }
  return all;
}

}  // namespace

SessionEndSeconds measureSessionEnd(const std::filesystem::path& folder, const std::vector<double>& times) {
  const std::uint64_t lines = times.size();
  testing::FakePlatform fakes;
  CommandRunner commandRunner{fakes.shell, fakes.files, fakes.agentLog};
  FileCollector fileCollector{fakes.files, fakes.agentLog, fakes.configuration.roots};
  _ZalLoggingAgentPingRunner pingRunner{fakes.queues, fakes.pings, fakes.agentLog};
  BuildInformationCache buildInformation;
  TimeZoneCache timeZone;
  SessionServices services{fakes.host,
                           fakes.host,
                           fakes.localNotifications,
                           fakes.agentLog,
                           fakes.telephony,
                           fakes.networkStatus,
                           fakes.deviceRegistry,
                           fakes.systemVersion,
                           fakes.files,
                           commandRunner,
                           fileCollector,
                           pingRunner,
                           fakes.configuration.roots,
                           fakes.configuration.endpoints,
                           buildInformation,
                           timeZone,
                           {}};
  const std::filesystem::path base = folder / "Vistel";
  const auto session = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", base.string(), services);
  session->beginSessionWithSender("callservice");
  for (std::uint64_t number = 0; number < lines; ++number) {
    session->logDescription("Transport", "route changed, packet number " + std::to_string(number),
                            "callservice", times[number]);
  }
  // The last line of a session is its end, also on this clock.
  fakes.host.setWall(wallTimeFromSeconds(*std::max_element(times.begin(), times.end()) + 1));
  SessionEndSeconds seconds;
  const Stopwatch watch;
  session->endSessionWithSender("callservice");
  seconds.end = watch.seconds();
  const std::string bytes = takeFiles(base, lines);
  seconds.plainWrite = secondsToWrite(folder / "plain.log", bytes);
  std::filesystem::remove(folder / "plain.log");
  return seconds;
}

}  // namespace zal::bench
