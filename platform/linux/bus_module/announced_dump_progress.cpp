#include "platform/linux/bus_module/announced_dump_progress.h"

#include <mutex>
#include <string>
#include <utility>

namespace zal {
namespace {

class AnnouncedDump : public DumpProgress {
 public:
  AnnouncedDump(std::shared_ptr<DumpProgress> record, DumpPlan plan,
                const AnnouncedDumpProgress::Announce& announce)
      : _record(std::move(record)), _plan(std::move(plan)), _announce(announce) {
    _tell("begin", "", "");
  }
  ~AnnouncedDump() override { _end("cut off", ""); }
  AnnouncedDump(const AnnouncedDump&) = delete;
  AnnouncedDump& operator=(const AnnouncedDump&) = delete;

  void step(std::size_t number) override {
    _record->step(number);
    const std::lock_guard lock(_mutex);
    if (_ended) return;
    _step = number;
    const bool isPlanned = number >= 1 && number <= _plan.steps.size();
    _tell("step", isPlanned ? _plan.steps[number - 1] : "", "");
  }
  void missing(std::string_view what, std::string_view why) override {
    _record->missing(what, why);
    const std::lock_guard lock(_mutex);
    if (_ended || _missing > AnnouncedDumpProgress::kMostMissing) return;
    const bool isOneMore = _missing++ == AnnouncedDumpProgress::kMostMissing;
    isOneMore ? _tell("missing", "more", "the progress record has the whole list")
              : _tell("missing", std::string(what), std::string(why));
  }
  void done(const std::string& archivePath) override {
    _record->done(archivePath);
    _end("done", archivePath);
  }
  void failed(std::string_view reason) override {
    _record->failed(reason);
    _end("failed", std::string(reason));
  }

 private:
  void _end(const char* event, std::string detail) {
    const std::lock_guard lock(_mutex);
    if (!std::exchange(_ended, true)) _tell(event, "", std::move(detail));
  }
  void _tell(const char* event, std::string what, std::string detail) const {
    _announce({.directory = _plan.directory,
               .service = _plan.service,
               .event = event,
               .step = _step,
               .steps = _plan.steps.size(),
               .what = std::move(what),
               .detail = std::move(detail)});
  }

  const std::shared_ptr<DumpProgress> _record;
  const DumpPlan _plan;
  const AnnouncedDumpProgress::Announce& _announce;
  std::mutex _mutex;  // also keeps the news in their order
  // Guarded by _mutex from here on.
  std::size_t _step = 0, _missing = 0;
  bool _ended = false;
};

}  // namespace

AnnouncedDumpProgress::AnnouncedDumpProgress(DumpProgressRecords& records, Announce announce)
    : _records(records), _announce(std::move(announce)) {}

std::shared_ptr<DumpProgress> AnnouncedDumpProgress::begin(DumpPlan plan) {
  auto record = _records.begin(plan);
  return std::make_shared<AnnouncedDump>(std::move(record), std::move(plan), _announce);
}

}  // namespace zal
