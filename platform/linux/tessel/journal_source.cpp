#include "platform/linux/tessel/journal_source.h"

#include <cstring>
#include <filesystem>
#include <initializer_list>
#include <system_error>

#include "platform/linux/tessel/line_output.h"

namespace zal::tessel {
namespace {

std::string trouble(const char* what, int error) {
  return std::string("the journal cannot be ") + what + ": " + std::generic_category().message(-error);
}

bool holdsJournal(const std::string& directory) {
  std::error_code error;
  for (std::filesystem::recursive_directory_iterator entry(directory, error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->path().extension() == ".journal") return true;
  }
  return false;
}

}  // namespace

std::unique_ptr<JournalSource> JournalSource::open(const std::optional<std::string>& directory,
                                                   const Clock& clock, std::string& trouble) {
  sd_journal* raw = nullptr;
  const int result = directory ? sd_journal_open_directory(&raw, directory->c_str(), 0)
                               : sd_journal_open(&raw, SD_JOURNAL_LOCAL_ONLY);
  if (result < 0) {
    trouble = tessel::trouble("opened", result);
    return nullptr;
  }
  Journal journal(raw);
  const bool found = directory
                         ? holdsJournal(*directory)
                         : sd_journal_has_runtime_files(raw) > 0 || sd_journal_has_persistent_files(raw) > 0;
  if (!found) {
    trouble = "there is no journal that this user may read";
    return nullptr;
  }
  // No limit: a long message is one all the same.
  (void)sd_journal_set_data_threshold(raw, 0);
  return std::unique_ptr<JournalSource>(new JournalSource(std::move(journal), clock));
}

std::optional<std::string> JournalSource::print(std::optional<WallTime> since, LineOutput& output) {
  const int result = since
                         ? sd_journal_seek_realtime_usec(
                               _journal.get(), static_cast<std::uint64_t>(since->time_since_epoch().count()))
                         : sd_journal_seek_head(_journal.get());
  if (result < 0) return trouble("searched", result);
  return _printRest(since.value_or(WallTime::min()), output);
}

std::string JournalSource::follow(LineOutput& output) {
  int result = sd_journal_seek_tail(_journal.get());
  // The tail is behind the last entry only once that one was stepped on; where there is none, whatever
  // comes is new.
  if (result >= 0) result = sd_journal_previous(_journal.get());
  if (result == 0) result = sd_journal_seek_head(_journal.get());
  if (result < 0) return trouble("searched", result);
  for (;;) {
    if (auto failed = _printRest(WallTime::min(), output)) return *failed;
    result = sd_journal_wait(_journal.get(), static_cast<std::uint64_t>(-1));
    if (result < 0 && result != -EINTR) return trouble("watched", result);
  }
}

std::optional<std::string> JournalSource::_printRest(WallTime since, LineOutput& output) {
  for (;;) {
    const int result = sd_journal_next(_journal.get());
    if (result < 0) return trouble("read", result);
    if (result == 0) return std::nullopt;
    std::uint64_t time = 0;
    if (sd_journal_get_realtime_usec(_journal.get(), &time) < 0) continue;  // a damaged entry
    const WallTime moment{std::chrono::microseconds(time)};
    if (moment < since) continue;
    if (!output.write(recordLine(_record(moment), _clock))) return output.trouble();
  }
}

Record JournalSource::_record(WallTime time) const {
  const auto firstOf = [this](std::initializer_list<const char*> names) {
    for (const char* name : names) {
      if (std::string value = _field(name); !value.empty()) return value;
    }
    return std::string();
  };
  Record record{time, firstOf({"_HOSTNAME"}), firstOf({"SYSLOG_IDENTIFIER", "_COMM"}),
                firstOf({"_PID", "SYSLOG_PID"}), _field("MESSAGE")};
  if (record.host.empty()) record.host = "-";
  if (record.name.empty()) record.name = "unknown";
  return record;
}

std::string JournalSource::_field(const char* name) const {
  const void* data = nullptr;
  std::size_t size = 0;
  if (sd_journal_get_data(_journal.get(), name, &data, &size) < 0) return {};
  const std::size_t prefix = std::strlen(name) + 1;  // "NAME="
  return size < prefix ? std::string() : std::string(static_cast<const char*>(data) + prefix, size - prefix);
}

}  // namespace zal::tessel
