#include "platform/linux/log/journal_stream.h"

#include <sys/stat.h>

#include <string>

namespace zal {

bool isJournalStream(std::string_view variable, int descriptor) {
  struct stat status {};
  if (variable.empty() || ::fstat(descriptor, &status) != 0) return false;
  return variable == std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
}

}  // namespace zal
