#include <sys/mman.h>
#include <unistd.h>

#include "cli/archive_verdict.h"
#include "fuzz/archive_fuzzer.h"
#include "fuzz/promise.h"
#include "platform/linux/archive/inspect_archive.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/whole_file.h"

namespace zal {

void fuzzArchive(const std::uint8_t* data, std::size_t size) {
  const Descriptor file(::memfd_create("fuzzed-archive", MFD_CLOEXEC));
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  if (!file.isOpen() || writeWhole(file.get(), bytes)) return;
  const ArchiveInspection archive = inspectArchive(file.get());
  promise(archive.isArchive || archive.entries.empty(), "what is no archive has no entries");
  const ArchiveVerdict verdict = judgeArchive(archive);
  promise(verdict.files <= archive.entries.size(), "no more files are there than entries");
  bool isTroubled = !archive.trouble.empty();
  // No piece of the file counts twice, and deflate makes at most 1032 bytes of one.
  promise(verdict.bytes <= size * 1032, "what is there came out of the file");
  for (const InspectedEntry& entry : archive.entries) {
    isTroubled = isTroubled || !entry.trouble.empty();
    promise(entry.sha256.empty() || entry.trouble.empty(), "what is damaged has no hash");
  }
  promise(!isTroubled || !verdict.damaged.empty(), "trouble is damage");
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzArchive(data, size);
  return 0;
}
#endif
