#include "tests/linux/archive/archive_readers.h"

#include <sys/wait.h>

#include <array>
#include <cstdio>

namespace zal::testing {

std::string printed(const std::string& command) {
  FILE* pipe = ::popen(("LC_ALL=C.UTF-8; export LC_ALL; ( " + command + " ) 2>&1").c_str(), "r");
  if (pipe == nullptr) return "no shell";
  std::string text;
  std::array<char, 4096> block;
  for (std::size_t count = 0; (count = std::fread(block.data(), 1, block.size(), pipe)) > 0;) {
    text.append(block.data(), count);
  }
  const int status = ::pclose(pipe);
  return status == 0 ? text : text + "[status " + std::to_string(WEXITSTATUS(status)) + "]";
}

std::string complaintsAbout(const std::string& archive) {
  const std::string quoted = "'" + archive + "'";
  return printed("unzip -tqq " + quoted) +
         printed("7z t -bd " + quoted + " > " + quoted + ".7z || cat " + quoted +
                 ".7z; grep -i -E 'warning|error' " + quoted + ".7z; rm " + quoted + ".7z") +
         printed("bsdtar -xOf " + quoted + " > /dev/null") +
         printed(
             "python3 -c 'import sys, zipfile; z = zipfile.ZipFile(sys.argv[1]); print(z.testzip() or \"\", "
             "end=\"\")' " +
             quoted);
}

std::string unpack(const std::string& archive, const std::string& directory) {
  return printed("mkdir '" + directory + "' && cd '" + directory + "' && unzip -q '" + archive + "'");
}

}  // namespace zal::testing
