#include "dump/latest_link.h"

#include <filesystem>
#include <system_error>

#include "collectors/plain_name.h"
#include "dump/several_attempts.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "session/collected_files.h"

namespace zal {
namespace {

std::string linkOf(const std::string& logRoot, const std::string& service) {
  return logRoot + "/" + service + "/Latest-" + service;
}

}  // namespace

void linkLatestArchive(FilePlacement& files, const std::string& logRoot, const std::string& service,
                       const std::string& archive, AgentLog& log) {
  if (!isPlainName(service)) {
    log.warning("Refused the link to the latest archive of \"" + printable(service) +
                "\": its name leads out of the log directory");
    return;
  }
  const std::string link = linkOf(logRoot, service);
  const std::error_code error = inSeveralAttempts([&] {
    const std::error_code trouble = files.remove(link);
    return trouble ? trouble : files.linkSymbolically(archive, link);
  });
  // Without logs of the service there is no directory for it.
  if (error && error != std::errc::no_such_file_or_directory)
    log.warning("Could not link the latest archive at " + link + ": " + error.message());
}

void linkArchiveOfEarlier(FilePlacement& files, const std::string& logRoot, const std::string& service,
                          const std::string& archive, AgentLog& log) {
  std::error_code error;
  if (isPlainName(service)) {
    const auto linked = std::filesystem::last_write_time(linkOf(logRoot, service), error);
    if (!error && linked >= std::filesystem::last_write_time(archive, error)) return;
  }
  linkLatestArchive(files, logRoot, service, archive, log);
}

}  // namespace zal
