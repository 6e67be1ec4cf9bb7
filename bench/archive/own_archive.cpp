#include "bench/archive/own_archive.h"

#include <cstdio>
#include <filesystem>

#include "platform/linux/archive/zip_file_copier.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"

namespace zal::bench {
namespace {

class StandardErrorLog : public AgentLog {
 public:
  [[nodiscard]] bool isEnabled(std::string_view /*category*/) const override { return false; }
  void log(std::string_view /*category*/, std::string_view /*text*/) override {}
  void notice(std::string_view text) override { _print(text); }
  void warning(std::string_view text) override { _print(text); }
  void console(std::string_view /*category*/, std::string_view text) override { _print(text); }
  void backtrace() override {}

 private:
  static void _print(std::string_view text) {
    fprintf(stderr, "%.*s\n", static_cast<int>(text.size()), text.data());
  }
};

}  // namespace

bool makeOwnArchive(const std::string& directory, const std::string& output, ArchiveCompression compression) {
  LinuxRunLoop loop;
  StandardErrorLog log;
  LinuxWorkQueues queues(loop, [&log](std::string_view line) { log.warning(line); });
  ZipFileCopier copier(queues, log, compression);
  const auto job = copier.makeJob(directory, output, directory, CopierOperation::compressIntoZip,
                                  queues.main(), [&loop](FileCopierJob& /*job*/) { loop.stop(); });
  // As every dump's archive has it: with the hash of each file.
  job->endWith({"Manifest.json", [](const ArchiveContent& content) {
                  std::string rows;
                  for (const ArchivedFile& file : content.files) rows += file.name + ' ' + file.sha256 + '\n';
                  return rows;
                }});
  job->start();
  loop.run();
  return std::filesystem::exists(output);
}

}  // namespace zal::bench
