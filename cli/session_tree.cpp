#include "cli/session_tree.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <tuple>
#include <utility>

namespace zal {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view kArchiveEnding = ".zip";

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
void forEachEntry(const std::string& parent, Visit&& visit) {
  std::error_code error;
  fs::directory_iterator entry(parent, fs::directory_options::skip_permission_denied, error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    std::error_code ignored;
    visit(entry->path(), entry->symlink_status(ignored));
  }
}

bool isArchiveName(const std::string& name) { return name.ends_with(kArchiveEnding); }

std::string withoutArchiveEnding(std::string name) {
  if (isArchiveName(name)) name.resize(name.size() - kArchiveEnding.size());
  return name;
}

std::optional<std::vector<SessionFile>> filesOf(const std::string& path, bool isArchive,
                                                ArchiveReader& archives) {
  if (!isArchive) return filesBelow(path);
  auto files = archives.files(path);
  if (files)
    std::sort(files->begin(), files->end(), [](const auto& a, const auto& b) { return a.path < b.path; });
  return files;
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

std::optional<SessionDirectory> readSession(const std::string& path, ArchiveReader& archives) {
  std::string plain = path;
  while (plain.size() > 1 && plain.back() == '/') plain.pop_back();
  std::error_code error;
  const bool isDirectory = fs::is_directory(plain, error);
  if (!isDirectory && !isArchiveName(plain)) return std::nullopt;
  auto files = filesOf(plain, !isDirectory, archives);
  if (!files) return std::nullopt;
  const fs::path asPath(plain);
  const std::string name = asPath.filename().string();
  SessionDirectory session =
      parseSessionName(isDirectory ? name : withoutArchiveEnding(name)).value_or(SessionDirectory{});
  session.type = asPath.parent_path().filename().string();
  session.path = plain;
  session.isArchive = !isDirectory;
  session.files = std::move(*files);
  return session;
}

std::vector<SessionDirectory> findSessions(const std::string& root, ArchiveReader& archives) {
  std::vector<SessionDirectory> sessions;
  forEachEntry(root, [&](const fs::path& type, fs::file_status typeStatus) {
    if (!fs::is_directory(typeStatus)) return;
    forEachEntry(type.string(), [&](const fs::path& path, fs::file_status status) {
      const std::string name = path.filename().string();
      const bool isArchive = fs::is_regular_file(status) && isArchiveName(name);
      if (!isArchive && !fs::is_directory(status)) return;
      if (!parseSessionName(isArchive ? withoutArchiveEnding(name) : name)) return;
      if (auto session = readSession(path.string(), archives)) sessions.push_back(std::move(*session));
    });
  });
  std::sort(sessions.begin(), sessions.end(), [](const auto& a, const auto& b) {
    return std::tie(b.started, a.type, a.path) < std::tie(a.started, b.type, b.path);
  });
  return sessions;
}

}  // namespace zal
