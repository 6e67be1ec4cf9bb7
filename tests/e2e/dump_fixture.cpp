#include "tests/e2e/dump_fixture.h"

#include <algorithm>
#include <cstdio>
#include <stdexcept>

namespace zal::testing {
namespace {

std::string quoted(const std::string& text) {
  std::string result = "'";
  for (const char c : text) result += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return result + "'";
}

/// unzip takes names for patterns; without a backslash of their own they name themselves.
std::string asPattern(const std::string& name) {
  std::string pattern;
  for (const char c : name) {
    if (c == '[' || c == ']' || c == '*' || c == '?' || c == '\\') pattern += '\\';
    pattern += c;
  }
  return pattern;
}

}  // namespace

std::string DumpFixture::outputOf(const std::string& command) {
  FILE* const output = ::popen(command.c_str(), "r");
  if (output == nullptr) throw std::runtime_error("cannot run " + command);
  std::string text;
  char buffer[65536];
  for (std::size_t count = 0; (count = std::fread(buffer, 1, sizeof buffer, output)) > 0;)
    text.append(buffer, count);
  if (::pclose(output) != 0) throw std::runtime_error("failed: " + command + "\n" + text);
  return text;
}

std::vector<std::string> DumpFixture::entriesOf(const std::string& archive) {
  outputOf("unzip -tqq " + quoted(archive) + " 2>&1");
  std::vector<std::string> names;
  const std::string top = std::filesystem::path(archive).stem().string() + "/";
  for (const std::string& line : linesOf(outputOf("unzip -Z1 " + quoted(archive)))) {
    EXPECT_TRUE(line.starts_with(top)) << line;
    if (!line.ends_with('/')) names.push_back(line.substr(std::min(top.size(), line.size())));
  }
  std::sort(names.begin(), names.end());
  return names;
}

std::string DumpFixture::textIn(const std::string& archive, const std::string& entry) {
  const std::string top = std::filesystem::path(archive).stem().string() + "/";
  return outputOf("unzip -p " + quoted(archive) + " " + quoted(asPattern(top + entry)));
}

std::vector<std::string> DumpFixture::reportsEndingWith(const std::string& ending) const {
  std::vector<std::string> found;
  std::error_code error;
  std::filesystem::recursive_directory_iterator entry(sandbox.reportRoot(), error);
  // The tree changes meanwhile: what vanishes is passed over.
  for (; !error && entry != std::filesystem::recursive_directory_iterator(); entry.increment(error)) {
    // The area for archives that are still being made.
    if (entry->path().filename().string().starts_with('.')) {
      entry.disable_recursion_pending();
    } else if (entry->path().string().ends_with(ending)) {
      found.push_back(entry->path());
    }
  }
  std::sort(found.begin(), found.end());
  return found;
}

}  // namespace zal::testing
