#include "collectors/rotated_log_sets.h"

#include <span>
#include <string_view>

#include "collectors/file_collector.h"
#include "collectors/plain_name.h"
#include "platform/agent_log.h"
#include "platform/directory_roots.h"

namespace zal {
namespace {

// What follows the set's name, in the order of linking.
constexpr std::string_view kRecent[] = {"-Event.log", "-Event.log.1.zip", ".log",
                                        ".log.1.zip", ".log.2.zip",       ".log.3.zip"};
// The first event generation stands in both lists: a second link to a taken name changes nothing.
constexpr std::string_view kOlder[] = {
    "-Event.log.1.zip", "-Event.log.2.zip", "-Event.log.3.zip", "-Event.log.4.zip", "-Event.log.5.zip",
    "-Event.log.6.zip", "-Event.log.7.zip", "-Event.log.8.zip", "-Event.log.9.zip", ".log.4.zip",
    ".log.5.zip",       ".log.6.zip",       ".log.7.zip",       ".log.8.zip",       ".log.9.zip"};

void linkFiles(FileCollector& collector, const DirectoryRoots& roots, const std::string& name,
               const std::string& destination, std::span<const std::string_view> endings) {
  const std::string start = roots.UserLogRoot + "/" + name + "/" + name;
  const std::string directory = destination + "/" + name;
  for (const auto ending : endings) {
    collector.LinkFileIntoDirectory(std::string(start).append(ending), directory, "");
  }
}

}  // namespace

void LinkRotatedLogSets(FileCollector& collector, const DirectoryRoots& roots, AgentLog& log,
                        const std::vector<std::string>& names, const std::string& destination,
                        bool includeAllGenerations) {
  collector.makeDirectory(destination);
  for (const auto& name : names) {
    if (!isPlainName(name)) {
      log.warning("Refused the log set \"" + name + "\": its name leads out of the log directory");
      continue;
    }
    linkFiles(collector, roots, name, destination, kRecent);
    if (includeAllGenerations) linkFiles(collector, roots, name, destination, kOlder);
  }
}

void LinkRecentLogSets(FileCollector& collector, const DirectoryRoots& roots, AgentLog& log,
                       const std::vector<std::string>& names, const std::string& destination) {
  LinkRotatedLogSets(collector, roots, log, names, destination, false);
}

}  // namespace zal
