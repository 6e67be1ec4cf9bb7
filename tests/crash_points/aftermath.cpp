#include "tests/crash_points/aftermath.h"

#include <fcntl.h>

#include <algorithm>
#include <filesystem>

#include "cli/archive_verdict.h"
#include "platform/linux/archive/inspect_archive.h"
#include "platform/linux/archive/zip_contents.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/progress/progress_file.h"
#include "tests/crash_points/expected_texts.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

std::vector<std::string> everythingBelow(const std::string& directory) {
  std::vector<std::string> paths;
  std::error_code error;
  for (fs::recursive_directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    paths.push_back(entry->path());
  }
  return paths;
}

/// The numbers that follow the mark, in order.
std::vector<int> numbersIn(const std::string& text, const std::string& mark) {
  std::vector<int> numbers;
  for (std::size_t at = text.find(mark); at != std::string::npos; at = text.find(mark, at + 1)) {
    const char* const digits = text.c_str() + at + mark.size();
    char* end = nullptr;
    const long number = std::strtol(digits, &end, 10);
    if (end != digits && *end == '.') numbers.push_back(static_cast<int>(number));
  }
  return numbers;
}

}  // namespace

Aftermath::Aftermath(const AgentSandbox& sandbox) : _sandbox(sandbox) {
  std::error_code error;
  for (const auto& entry : fs::directory_iterator(sandbox.reportRoot() + "/" + kSessionType, error)) {
    (entry.is_directory() ? _directories : _archives).push_back(entry.path());
  }
}

std::vector<Aftermath::GatheredText> Aftermath::_gathered(const std::string& ofName) const {
  std::vector<GatheredText> found;
  const auto isWanted = [&](const std::string& path) {
    return fs::path(path).filename().string().starts_with(ofName);
  };
  for (const std::string& directory : _directories) {
    // What could be written of a session whose logs were written whole by the next agent.
    const std::size_t aside = directory.find(" (not archived)");
    const bool isRewritten = aside != std::string::npos && _isRecovered(directory.substr(0, aside));
    for (const std::string& path : everythingBelow(directory)) {
      if (isRewritten && fs::path(path).parent_path() == directory && ofName.ends_with("Log (")) continue;
      if (isWanted(path)) found.push_back({directory, path, readFile(path)});
    }
  }
  for (const std::string& archive : _archives) {
    // Kept because the archive has not all of it.
    if (fs::exists(archive.substr(0, archive.size() - 4) + " (not archived)")) continue;
    if (ofName.ends_with("Log (") && _isRecovered(archive.substr(0, archive.size() - 4))) continue;
    for (const ZipEntry& entry : listZip(archive).value_or(std::vector<ZipEntry>())) {
      if (isWanted(entry.name))
        found.push_back({archive, entry.name, readZipEntry(archive, entry.name).value_or("")});
    }
  }
  return found;
}

bool Aftermath::_isRecovered(const std::string& directory) {
  const std::vector<std::string> paths = everythingBelow(directory);
  return std::any_of(paths.begin(), paths.end(), [](const std::string& path) {
    return fs::path(path).filename().string().starts_with("Verbose Log (") &&
           readFile(path).starts_with("[Recovered: ");
  });
}

void Aftermath::_checkNumbers(const std::string& text, const std::string& mark, const std::set<int>& told,
                              const std::set<int>& confirmed, const std::string& where) {
  const std::vector<int> numbers = numbersIn(text, mark);
  if (std::adjacent_find(numbers.begin(), numbers.end(), std::greater_equal<>()) != numbers.end())
    fail(where + ": twice or out of order");
  const std::set<int> there(numbers.begin(), numbers.end());
  for (const int number : confirmed) {
    if (!there.contains(number)) fail(where + ": lost " + mark + std::to_string(number));
  }
  for (const int number : there) {
    if (!told.contains(number)) fail(where + ": invented " + mark + std::to_string(number));
  }
}

void Aftermath::checkSession(const Told& told) {
  std::string verbose, simple;
  for (const GatheredText& log : _gathered("Verbose Log (")) {
    verbose += log.text;
    if (!told.mayLackEnds && log.text.find("] End Session") == std::string::npos)
      fail("without its end: " + log.name);
  }
  for (const GatheredText& log : _gathered("Log (")) {
    simple += log.text;
    if (!told.mayLackEnds && log.text.find("] End Session") == std::string::npos)
      fail("without its end: " + log.name);
  }
  _checkNumbers(verbose, kEntryMark, told.entries, told.confirmedEntries, "the session");
  for (const std::string& line : told.confirmedHeaders) {
    if (verbose.find(line) == std::string::npos) fail("the verbose log lost \"" + line + '"');
    if (simple.find(line) == std::string::npos) fail("the simple log lost \"" + line + '"');
  }
}

void Aftermath::checkLogSet(const Told& told) {
  _checkNumbers(_sandbox.wholeLogSet(kSessionType), kRecordMark, told.records, told.confirmedRecords,
                "the log set");
}

void Aftermath::checkGatheredFile(const std::string& path, int most) {
  int copies = 0;
  const std::string source = _sandbox / path;
  const std::string name = fs::path(path).stem().string();
  if (fs::exists(source)) {
    ++copies;
    if (readFile(source) != kGatheredText) fail(name + ": its source is not whole");
  }
  for (const GatheredText& file : _gathered(name)) {
    ++copies;
    if (file.text != kGatheredText) fail("not whole: " + file.name);
  }
  if (copies < 1 || copies > most) fail(name + " is there " + std::to_string(copies) + " times");
}

void Aftermath::checkSource(const std::string& path, const std::string& text) {
  if (readFile(_sandbox / path) != text) fail("not as it was: " + path);
  for (const GatheredText& file : _gathered(fs::path(path).filename().string())) {
    if (file.text != text) fail("not whole: " + file.name);
  }
}

void Aftermath::checkArchives() {
  for (const std::string& archive : _archives) {
    const Descriptor file(::open(archive.c_str(), O_RDONLY | O_CLOEXEC));
    const ArchiveVerdict verdict = judgeArchive(inspectArchive(file.get()));
    if (!verdict.hasManifest) fail("without a manifest: " + archive);
    for (const auto& finding : verdict.damaged)
      fail(archive + ": damaged: " + finding.what + ": " + finding.why);
    if (_isRecovered(archive.substr(0, archive.size() - 4))) continue;
    if (fs::exists(archive.substr(0, archive.size() - 4))) fail("beside its directory: " + archive);
  }
  const std::string link = _sandbox.logRoot() + "/" + kSessionType + "/Latest-" + kSessionType;
  std::error_code error;
  const std::string newest = fs::read_symlink(link, error);
  if (!_archives.empty() && std::find(_archives.begin(), _archives.end(), newest) == _archives.end())
    fail("the newest archive is not linked");
}

void Aftermath::checkStrays() {
  for (const std::string& path : everythingBelow(_sandbox / "")) {
    const std::string name = fs::path(path).filename().string();
    // It may go while it is looked at.
    std::error_code gone;
    const bool isArea = name.starts_with(".com.vendel.lirra-") && (fs::is_empty(path, gone) || gone);
    if ((name.starts_with('.') && !isArea) || path.find("/BlackBox/") != std::string::npos)
      fail("left behind: " + path);
  }
  for (const ListedDumpProgress& listed : listDumpProgress(progressDirectory(_sandbox / "runtime"))) {
    if (listed.record.state == DumpProgressRecord::State::running) fail("still runs: " + listed.name);
  }
}

}  // namespace zal::testing
