#include "dump/latest_link.h"

#include <filesystem>
#include <system_error>

#include "collectors/plain_name.h"
#include "platform/agent_log.h"
#include "session/collected_files.h"

namespace zal {
namespace {

std::string linkOf(const std::string& logRoot, const std::string& service) {
  return logRoot + "/" + service + "/Latest-" + service;
}

}  // namespace

void linkLatestArchive(const std::string& logRoot, const std::string& service, const std::string& archive,
                       AgentLog& log) {
  if (!isPlainName(service)) {
    log.warning("Refused the link to the latest archive of \"" + printable(service) +
                "\": its name leads out of the log directory");
    return;
  }
  const std::string link = linkOf(logRoot, service);
  std::error_code ignored;
  std::filesystem::remove_all(link, ignored);
  std::filesystem::create_symlink(archive, link, ignored);
}

void linkArchiveOfEarlier(const std::string& logRoot, const std::string& service, const std::string& archive,
                          AgentLog& log) {
  std::error_code error;
  if (isPlainName(service)) {
    const auto linked = std::filesystem::last_write_time(linkOf(logRoot, service), error);
    if (!error && linked >= std::filesystem::last_write_time(archive, error)) return;
  }
  linkLatestArchive(logRoot, service, archive, log);
}

}  // namespace zal
