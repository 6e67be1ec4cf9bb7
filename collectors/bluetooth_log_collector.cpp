#include <chrono>
#include <filesystem>

#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "platform/configuration.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

/// What the daemon gets to write out its logs after it was asked to.
constexpr std::chrono::seconds kTimeToWrite{1};

}  // namespace

void LogCollectors::CollectBluetoothLogs(const std::string& destination) {
  _services.table.runInBackground(_services.commands, CommandGroup::bluetooth, destination);
  const auto take = [services = _services, destination] {
    // A dump that was archived and removed meanwhile must not rise again with one file in it.
    std::error_code error;
    if (!std::filesystem::exists(destination, error)) return;
    const DirectoryRoots& roots = services.configuration.roots;
    services.files.LinkFileIntoDirectory(roots.UartLogFile, destination, "");
    services.files.CopyDirectoryContents(roots.MobileLogRoot + "/Bluetooth", destination);
  };
  _services.queues.global(QueuePriority::standard).asyncAfter(kTimeToWrite, take);
}

}  // namespace zal
