#include "collectors/missing_output.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>

namespace zal {
namespace {

namespace fs = std::filesystem;

/// Room for many complaints; what a program has to say is usually longer.
constexpr std::uintmax_t kLargestComplaint = 4096;

constexpr std::array<std::string_view, 4> kShells = {"sh", "dash", "bash", "ash"};
constexpr std::array<std::string_view, 5> kReasons = {
    "not found", "command not found", "No such file or directory", "Permission denied", "Is a directory",
};
constexpr std::string_view kWrapperComplaint = "timeout: failed to run command ";
// The last are those of a UTF-8 locale.
constexpr std::array<std::string_view, 3> kQuotes = {"'", "\xe2\x80\x98", "\xe2\x80\x99"};

template <std::size_t count>
bool contains(const std::array<std::string_view, count>& texts, std::string_view text) {
  return std::find(texts.begin(), texts.end(), text) != texts.end();
}

/// What stands before the first ": ", which is taken off the text together with it.
std::optional<std::string_view> takeField(std::string_view& text) {
  const std::size_t end = text.find(": ");
  if (end == std::string_view::npos) return std::nullopt;
  const std::string_view field = text.substr(0, end);
  text.remove_prefix(end + 2);
  return field;
}

/// "1" or "line 1": where in its script the shell stood.
bool isPosition(std::string_view field) {
  if (field.starts_with("line ")) field.remove_prefix(5);
  return !field.empty() && field.find_first_not_of("0123456789") == std::string_view::npos;
}

std::optional<MissingProgram> programAndReason(std::string_view text) {
  const std::size_t end = text.rfind(": ");
  if (end == std::string_view::npos || end == 0) return std::nullopt;
  const std::string_view program = text.substr(0, end), reason = text.substr(end + 2);
  // "cannot create FILE" and its like are about redirections.
  if (!contains(kReasons, reason) || program.starts_with("cannot ")) return std::nullopt;
  return MissingProgram{std::string(program), std::string(reason)};
}

std::string_view withoutQuotes(std::string_view text) {
  for (const std::string_view quote : kQuotes) {
    if (text.starts_with(quote)) text.remove_prefix(quote.size());
    if (text.ends_with(quote)) text.remove_suffix(quote.size());
  }
  return text;
}

std::optional<MissingProgram> complaintOfTimeout(std::string_view line) {
  auto missing = programAndReason(line.substr(kWrapperComplaint.size()));
  if (missing) missing->program = std::string(withoutQuotes(missing->program));
  return missing;
}

std::optional<MissingProgram> complaint(std::string_view line) {
  if (line.starts_with(kWrapperComplaint)) return complaintOfTimeout(line);
  const auto shell = takeField(line);
  if (!shell || !contains(kShells, shell->substr(shell->rfind('/') + 1))) return std::nullopt;
  std::string_view rest = line;
  if (const auto field = takeField(rest); field && isPosition(*field)) line = rest;
  return programAndReason(line);
}

std::string contentOf(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::string content(kLargestComplaint, '\0');
  file.read(content.data(), static_cast<std::streamsize>(content.size()));
  content.resize(static_cast<std::size_t>(file.gcount()));
  return content;
}

bool isShortFile(const fs::directory_entry& entry) {
  std::error_code error;
  if (!fs::is_regular_file(entry.symlink_status(error)) || error) return false;
  const std::uintmax_t size = entry.file_size(error);
  return !error && size > 0 && size <= kLargestComplaint;
}

}  // namespace

std::vector<MissingProgram> missingPrograms(std::string_view output) {
  std::vector<MissingProgram> programs;
  while (!output.empty()) {
    const std::size_t end = std::min(output.find('\n'), output.size());
    auto missing = complaint(output.substr(0, end));
    if (!missing) return {};
    if (std::find(programs.begin(), programs.end(), *missing) == programs.end()) {
      programs.push_back(*std::move(missing));
    }
    output.remove_prefix(std::min(end + 1, output.size()));
  }
  return programs;
}

std::vector<MissingOutput> missingOutputs(const std::string& directory) {
  std::vector<MissingOutput> outputs;
  std::error_code error;
  fs::recursive_directory_iterator entry(directory, fs::directory_options::skip_permission_denied, error);
  for (; !error && entry != fs::recursive_directory_iterator(); entry.increment(error)) {
    if (!isShortFile(*entry)) continue;
    for (MissingProgram& missing : missingPrograms(contentOf(entry->path()))) {
      outputs.push_back({entry->path().lexically_relative(directory).string(), std::move(missing)});
    }
  }
  std::stable_sort(outputs.begin(), outputs.end(),
                   [](const MissingOutput& a, const MissingOutput& b) { return a.file < b.file; });
  return outputs;
}

}  // namespace zal
