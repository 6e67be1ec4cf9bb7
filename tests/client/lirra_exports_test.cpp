#include <cstdio>
#include <iterator>
#include <regex>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

std::string outputOf(const std::string& command) {
  std::string output;
  FILE* const pipe = ::popen(command.c_str(), "r");
  if (pipe == nullptr) return output;
  char buffer[4096];
  while (const std::size_t count = std::fread(buffer, 1, sizeof buffer, pipe)) output.append(buffer, count);
  ::pclose(pipe);
  return output;
}

std::set<std::string> allMatches(const std::string& text, const char* pattern) {
  std::set<std::string> result;
  const std::regex expression(pattern);
  for (std::sregex_iterator match(text.begin(), text.end(), expression), end; match != end; ++match) {
    result.insert((*match)[1]);
  }
  return result;
}

TEST(LirraExportsTest, LibraryExportsWhatTheHeaderDeclaresAndNothingElse) {
  const auto declared = allMatches(readFile(LIRRA_HEADER), R"((lirra_\w+)\()");
  EXPECT_EQ(declared.size(), 44U);
  auto exported = allMatches(outputOf("nm -D --defined-only " LIRRA_LIBRARY), R"(\s[A-Z]\s([^@\s]+))");
  exported.erase("LIRRA_0");  // the version itself
  EXPECT_EQ(exported, declared);
}

TEST(LirraExportsTest, LibraryNeedsNoLibraryOfOurs) {
  const auto needed = allMatches(outputOf("readelf -d " LIRRA_LIBRARY), R"(NEEDED.*\[(\w+))");
  EXPECT_TRUE(needed.contains("libc")) << "readelf told something";
  EXPECT_FALSE(needed.contains("libflatbuffers"));
}

}  // namespace
}  // namespace zal::testing
