#pragma once

#include <array>
#include <cstdio>
#include <string>

namespace zal::testing {

/// The content of an archive's entries, one after the other, as the host's unzip program reads it.
inline std::string unzipped(const std::string& archive) {
  FILE* pipe = ::popen(("unzip -p '" + archive + "' 2>&1").c_str(), "r");
  if (pipe == nullptr) return "unzip does not run";
  std::string content;
  std::array<char, 4096> block;
  for (std::size_t count = 0; (count = std::fread(block.data(), 1, block.size(), pipe)) > 0;) {
    content.append(block.data(), count);
  }
  const int status = ::pclose(pipe);
  return status == 0 ? content : "unzip failed: " + content;
}

}  // namespace zal::testing
