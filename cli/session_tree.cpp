#include "cli/session_tree.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <tuple>

namespace zal {
namespace {

namespace fs = std::filesystem;

/// '0' in the pattern stands for any digit.
bool matches(std::string_view text, std::string_view pattern) {
  return text.size() == pattern.size() &&
         std::equal(text.begin(), text.end(), pattern.begin(), [](char have, char want) {
           return want == '0' ? std::isdigit(static_cast<unsigned char>(have)) != 0 : have == want;
         });
}

std::vector<SessionFile> filesBelow(const std::string& directory) {
  std::vector<SessionFile> files;
  std::error_code error;
  fs::recursive_directory_iterator entry(directory, fs::directory_options::skip_permission_denied, error);
  for (; !error && entry != fs::recursive_directory_iterator(); entry.increment(error)) {
    std::error_code ignored;
    if (!fs::is_regular_file(entry->symlink_status(ignored))) continue;
    const std::uint64_t bytes = entry->file_size(ignored);
    files.push_back({entry->path().string().substr(directory.size() + 1), ignored ? 0 : bytes});
  }
  std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.path < b.path; });
  return files;
}

template <class Visit>
void forEachDirectory(const std::string& parent, Visit&& visit) {
  std::error_code error;
  fs::directory_iterator entry(parent, fs::directory_options::skip_permission_denied, error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    std::error_code ignored;
    if (fs::is_directory(entry->symlink_status(ignored))) visit(entry->path());
  }
}

}  // namespace

std::uint64_t SessionDirectory::bytes() const {
  std::uint64_t sum = 0;
  for (const SessionFile& file : files) sum += file.bytes;
  return sum;
}

std::optional<SessionDirectory> parseSessionName(std::string_view name) {
  constexpr std::string_view kDate = "0000-00-00 at 00-00-00";
  if (name.size() < kDate.size() || !matches(name.substr(0, kDate.size()), kDate)) return std::nullopt;
  SessionDirectory session;
  session.started = std::string(name.substr(0, 10)) + " " + std::string(name.substr(14, 8));
  std::replace(session.started.begin() + 11, session.started.end(), '-', ':');
  std::string_view rest = name.substr(kDate.size());
  for (const std::string_view role : {"Initiator", "Receiver"}) {
    const std::string ending = ") (" + std::string(role) + ")";
    if (!rest.starts_with(" (") || !rest.ends_with(ending) || rest.size() <= 2 + ending.size()) continue;
    session.zone = rest.substr(2, rest.size() - 2 - ending.size());
    session.role = role;
    return session;
  }
  return std::nullopt;
}

std::optional<SessionDirectory> readSession(const std::string& path) {
  std::string plain = path;
  while (plain.size() > 1 && plain.back() == '/') plain.pop_back();
  std::error_code error;
  if (!fs::is_directory(plain, error)) return std::nullopt;
  const fs::path asPath(plain);
  SessionDirectory session = parseSessionName(asPath.filename().string()).value_or(SessionDirectory{});
  session.type = asPath.parent_path().filename().string();
  session.path = plain;
  session.files = filesBelow(plain);
  return session;
}

std::vector<SessionDirectory> findSessions(const std::string& root) {
  std::vector<SessionDirectory> sessions;
  forEachDirectory(root, [&](const fs::path& type) {
    forEachDirectory(type.string(), [&](const fs::path& directory) {
      if (!parseSessionName(directory.filename().string())) return;
      if (auto session = readSession(directory.string())) sessions.push_back(std::move(*session));
    });
  });
  std::sort(sessions.begin(), sessions.end(), [](const auto& a, const auto& b) {
    return std::tie(b.started, a.type, a.path) < std::tie(a.started, b.type, b.path);
  });
  return sessions;
}

}  // namespace zal
