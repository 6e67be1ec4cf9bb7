#include "platform/linux/wifidump/wifidump.h"

#include <chrono>
#include <filesystem>
#include <iostream>
#include <system_error>

#include "platform/linux/files/directory_names.h"
#include "platform/linux/files/escaped_text.h"
#include "platform/linux/helper/bounded_program.h"
#include "platform/linux/helper/device_core_dumps.h"
#include "platform/linux/helper/dump_files.h"
#include "platform/linux/helper/option_words.h"
#include "platform/linux/helper/patience.h"
#include "platform/linux/wifidump/wireless_text.h"
#include "platform/open_directories.h"

namespace zal::wifidump {
namespace {

using Command = std::vector<std::string>;

constexpr int kDone = 0;
constexpr int kNothingHad = 1;
constexpr int kWrongUsage = 2;
constexpr int kCannotWrite = 3;
constexpr helper::ProgramLimits kToolLimits{.time = std::chrono::seconds{3}};
constexpr const char* kPrefix = "wifidump-";

constexpr const char* kHelp =
    R"(Writes the state of this host's Wi-Fi into a directory, in the place of what it wrote there before.

Usage: lirra-wifidump --directory DIR [--reason TEXT] [--limit SECONDS]

  --directory   where the files go; made when it is missing
  --reason      goes into the note
  --limit       for all of it (12); what was had by then stays

Exit codes: 0 done, 1 nothing was had but the note, 2 wrong usage, 3 the files cannot be written.
)";

struct Options {
  std::string directory;
  std::string reason;
  std::chrono::seconds limit{12};
  std::string root;   // before /sys: for tests
  std::string tools;  // searched instead of PATH: for tests
};

/// A tool about one interface; the interface's name stands between the two parts.
struct InterfaceQuestion {
  const char* name;
  Command words;
};

int fail(int code, const std::string& trouble) {
  std::cerr << "lirra-wifidump: " << escapedLine(trouble) << std::endl;
  return code;
}

class Dump {
 public:
  Dump(const Options& options, helper::DumpFiles& files, helper::Patience& patience)
      : _options(options), _files(files), _patience(patience) {}

  void take() {
    const std::string list = _write("iw-dev.txt", {"iw", "dev"});
    const auto interfaces = interfacesOf(list);
    for (const std::string& interface : interfaces) _writeInterface(interface);
    _write("iw-phy.txt", {"iw", "phy"});
    _write("nmcli-list.txt", {"nmcli", "-f", "all", "device", "wifi", "list", "--rescan", "no"});
    _writeKernelLog(interfaces);
    helper::copyDeviceCoreDumps(_options.root, _files, _patience);
  }

 private:
  std::string _write(const std::string& file, const Command& command) {
    const auto outcome = helper::runBounded(command, _patience, kToolLimits);
    std::string source = command.front();
    for (std::size_t i = 1; i < command.size(); ++i) source += " " + command[i];
    _files.writeOutcome(file, source, outcome, true);
    return outcome.output;
  }

  void _writeInterface(const std::string& interface) {
    static const std::vector<InterfaceQuestion> kQuestions = {{"link", {"link"}},
                                                              {"station", {"station", "dump"}},
                                                              {"survey", {"survey", "dump"}},
                                                              {"scan", {"scan", "dump"}}};
    for (const InterfaceQuestion& question : kQuestions) {
      Command command = {"iw", "dev", interface};
      command.insert(command.end(), question.words.begin(), question.words.end());
      _write("iw-" + interface + "-" + question.name + ".txt", command);
    }
  }

  void _writeKernelLog(const std::vector<std::string>& interfaces) {
    auto outcome = helper::runBounded({"dmesg"}, _patience, kToolLimits);
    const bool hasLines = !outcome.output.empty();
    outcome.output = wirelessLines(outcome.output, interfaces);
    if (hasLines && outcome.output.empty() && outcome.trouble.empty())
      outcome.trouble = "no line has to do with wireless";
    _files.writeOutcome("kernel.txt", "dmesg", outcome, true);
  }

  const Options& _options;
  helper::DumpFiles& _files;
  helper::Patience& _patience;
};

/// A directory that others fill too holds one dump of ours, not all of them.
void removeEarlierFiles(const std::string& directory) {
  std::error_code ignored;
  for (const std::string& name : namesIn(directory)) {
    if (name.starts_with(kPrefix)) std::filesystem::remove(directory + "/" + name, ignored);
  }
}

}  // namespace

int run(const std::vector<std::string>& words) {
  if (words == Command{"--help"}) {
    std::cout << kHelp;
    return kDone;
  }
  Options options;
  const bool areKnown = helper::takeOptions(words, {.texts = {{"--directory", &options.directory},
                                                              {"--reason", &options.reason},
                                                              {"--root", &options.root},
                                                              {"--tools", &options.tools}},
                                                    .times = {{"--limit", &options.limit}}});
  if (!areKnown || options.directory.empty())
    return fail(kWrongUsage, "a directory is needed; see lirra-wifidump --help");
  helper::Patience patience(options.limit);
  helper::searchForToolsIn(options.tools);
  if (const auto error = createDirectoriesWithMode0777(options.directory))
    return fail(kCannotWrite, options.directory + ": " + error.message());
  removeEarlierFiles(options.directory);
  helper::DumpFiles files(options.directory, kPrefix);
  Dump(options, files, patience).take();
  files.writeNote("note.txt", options.reason, patience);
  if (files.hasFailed())
    return fail(kCannotWrite, "a file in " + options.directory + " could not be written");
  return files.gaveSomething() ? kDone : kNothingHad;
}

}  // namespace zal::wifidump
