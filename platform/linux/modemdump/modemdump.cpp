#include "platform/linux/modemdump/modemdump.h"

#include <sys/resource.h>

#include <filesystem>
#include <iostream>
#include <system_error>

#include "platform/linux/baseband/hand_off_marker.h"
#include "platform/linux/files/directory_names.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/helper/device_core_dumps.h"
#include "platform/linux/helper/dump_files.h"
#include "platform/linux/helper/option_words.h"
#include "platform/linux/helper/patience.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/modemdump/daemon_log.h"
#include "platform/linux/modemdump/dump_names.h"
#include "platform/linux/modemdump/modem_daemons.h"
#include "platform/linux/modemdump/modem_tools.h"
#include "platform/linux/modemdump/system_bus.h"
#include "platform/open_directories.h"

namespace zal::modemdump {
namespace {

constexpr int kDone = 0;
constexpr int kNothingHad = 1;
constexpr int kWrongUsage = 2;
constexpr int kCannotWrite = 3;
constexpr int kAlreadyWritten = 4;
/// A call in progress goes first.
constexpr int kNice = 10;

constexpr const char* kHelp =
    R"(Writes one set of files about the modem's state.

Usage: lirra-modemdump --directory DIR --marker FILE [--reason TEXT] [--limit SECONDS] [--listening SECONDS]

  --directory   where the files go; made when it is missing
  --marker      is there while they are written, and gone at the end, however that comes
  --reason      goes into the note
  --limit       for all of it (60); what was had by then stays
  --listening   how long the modem's daemon is told to log everything (2)

Exit codes: 0 done, 1 nothing was had but the note, 2 wrong usage, 3 the files cannot be written,
4 another one holds the marker.
)";

int fail(int code, const std::string& trouble) {
  std::cerr << "lirra-modemdump: " << escapedLine(trouble) << std::endl;
  return code;
}

void removeOutdated(const std::string& directory) {
  std::error_code ignored;
  for (const std::string& name : outdatedNames(namesIn(directory)))
    std::filesystem::remove(directory + "/" + name, ignored);
}

void askBus(const Options& options, helper::DumpFiles& files, helper::Patience& patience) {
  auto connected = SystemBus::connect(patience);
  if (const auto* trouble = std::get_if<Trouble>(&connected)) {
    files.missing("modem daemons", trouble->text);
    return;
  }
  auto& bus = std::get<SystemBus>(connected);
  const ModemDaemon daemon = writeModemState(bus, files);
  writeToolOutput(daemon, files, patience);
  const auto meanwhile = [&] {
    if (daemon.kind == ModemDaemon::Kind::modemManager) writeCells(bus, daemon, files);
  };
  writeDaemonLog(bus, daemon, options.root, options.listening, meanwhile, files, patience);
}

int writeSet(const Options& options, helper::Patience& patience) {
  if (const auto error = createDirectoriesWithMode0777(options.directory))
    return fail(kCannotWrite, options.directory + ": " + error.message());
  const LinuxClock clock;
  helper::DumpFiles files(options.directory,
                          newSetPrefix(namesIn(options.directory), clock.wallNow(), clock));
  askBus(options, files, patience);
  writeControlDevices(options.root, files, patience);
  helper::copyDeviceCoreDumps(options.root, files, patience);
  files.writeNote("note.txt", options.reason, patience);
  removeOutdated(options.directory);
  if (files.hasFailed())
    return fail(kCannotWrite, "a file in " + options.directory + " could not be written");
  return files.gaveSomething() ? kDone : kNothingHad;
}

}  // namespace

std::optional<Options> parseOptions(const std::vector<std::string>& words) {
  Options options;
  const bool areKnown = helper::takeOptions(
      words, {.texts = {{"--directory", &options.directory},
                        {"--marker", &options.marker},
                        {"--reason", &options.reason},
                        {"--root", &options.root},
                        {"--tools", &options.tools}},
              .times = {{"--limit", &options.limit}, {"--listening", &options.listening}}});
  if (!areKnown || options.directory.empty() || options.marker.empty()) return std::nullopt;
  return options;
}

int run(const std::vector<std::string>& words) {
  if (words == std::vector<std::string>{"--help"}) {
    std::cout << kHelp;
    return kDone;
  }
  const auto options = parseOptions(words);
  if (!options) return fail(kWrongUsage, "a directory and a marker are needed; see lirra-modemdump --help");
  // Before the marker is ours: from here on signals cannot leave it behind.
  helper::Patience patience(options->limit);
  const auto marker = HandOffMarker::take(options->marker);
  if (const auto* error = std::get_if<std::error_code>(&marker)) {
    if (*error == std::errc::device_or_resource_busy)
      return fail(kAlreadyWritten, "another one holds " + options->marker);
    // The files are worth having without it.
    std::cerr << "lirra-modemdump: " << escapedLine(options->marker + ": " + error->message()) << std::endl;
  }
  (void)::setpriority(PRIO_PROCESS, 0, kNice);
  helper::searchForToolsIn(options->tools);
  return writeSet(*options, patience);
}

}  // namespace zal::modemdump
