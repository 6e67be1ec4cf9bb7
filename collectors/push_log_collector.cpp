#include <array>

#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "platform/configuration.h"

namespace zal {
namespace {

/// The push daemon rotates between two capture files an interface, without an extension.
constexpr std::array<std::string_view, 4> kPushCaptures = {
    "tcpdump_beacond_en0-0",
    "tcpdump_beacond_en0-1",
    "tcpdump_beacond_pdp_ip0-0",
    "tcpdump_beacond_pdp_ip0-1",
};

}  // namespace

void LogCollectors::CollectPushCaptureFiles(const std::string& destination) {
  const std::string directory = _services.configuration.roots.UserLogRoot + "/";
  for (const std::string_view name : kPushCaptures) {
    _services.files.LinkFileIntoDirectory(directory + std::string(name), destination, ".pcap");
  }
}

void LogCollectors::LinkFullPacketCapture(const std::string& destination) {
  _services.files.LinkFileIntoDirectory(_services.configuration.roots.UserLogRoot + "/tcpdump_en0-full.pcap",
                                        destination, "");
}

void LogCollectors::DumpPushServiceState(const std::string& destination) {
  const std::string& source = _services.configuration.collection.pushLogDirectory;
  if (destination.empty() || source.empty()) return;
  _services.files.makeDirectory(destination);
  _services.files.CopyDirectoryContents(source, destination);
  _services.table.runInBackground(_services.commands, CommandGroup::pushService, destination);
}

}  // namespace zal
