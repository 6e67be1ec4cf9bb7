#include "platform/linux/archive/zip_file_copier.h"

#include <malloc.h>
#include <unistd.h>

#include <utility>

#include "platform/linux/archive/kept_aside.h"
#include "platform/linux/archive/zip_archive.h"
#include "platform/linux/archive/zip_check.h"
#include "platform/linux/files/rename_no_replace.h"

namespace zal {
namespace {

struct JobDescription {
  std::string input, output, identifier;
  ArchiveCompression compression;
  RootedPaths paths;
};

class ZipJob : public FileCopierJob, public std::enable_shared_from_this<ZipJob> {
 public:
  ZipJob(JobDescription description, WorkQueues& queues, AgentLog& log, WorkQueue& queue,
         FileCopier::Completion completion)
      : _description(std::move(description)),
        _queues(queues),
        _log(log),
        _queue(queue),
        _completion(std::move(completion)) {
    std::string& input = _description.input;
    while (input.size() > 1 && input.back() == '/') input.pop_back();
  }

  [[nodiscard]] const std::string& identifier() const override { return _description.identifier; }

  void endWith(ArchiveEnding ending) override { _ending = std::move(ending); }

  void start() override {
    _queues.global(QueuePriority::standard).async([self = shared_from_this()] { self->_write(); });
  }

 private:
  void _write() {
    _outcome = writeZipArchive(
        _description.input, _description.output, _description.compression, _ending,
        [this](const std::string& line) { _log.notice(line); }, _description.paths);
    if (!_outcome.failure.empty()) return _fail(_outcome.failure);
    _queues.global(QueuePriority::standard).async([self = shared_from_this()] { self->_check(); });
  }

  void _check() {
    const std::string wrong = checkZipArchive(_description.output, _outcome.entries);
    if (!wrong.empty()) return _fail("the archive does not hold what was written: " + wrong);
    // Who asked deletes what is archived.
    if (_outcome.hasMissed) _setAside("has more than could be read for its archive");
    _complete();
  }

  void _fail(const std::string& reason) {
    if (_outcome.outputIsOurs) ::unlink(_description.output.c_str());
    const std::string& input = _description.input;
    std::error_code error;
    if (!nameIsTaken(input, error) && !error) {
      _log.notice("There is no \"" + input + "\" to archive");
      return _complete();
    }
    _setAside("could not be archived (" + reason + ")");
    _complete();
  }

  void _setAside(const std::string& why) {
    const std::string& input = _description.input;
    std::error_code error;
    const std::string aside = keepAside(input, error, _description.paths);
    _log.warning('"' + input + "\" " + why + "; " +
                 (error ? "it stays where it is, as it cannot be moved aside: " + error.message()
                        : "it is kept as \"" + aside + '"'));
  }

  void _complete() {
    // A collection is over: what it and its session had is free, in the heaps of many threads, which keep it.
    ::malloc_trim(0);
    _queue.async([self = shared_from_this()] { std::exchange(self->_completion, nullptr)(*self); });
  }

  JobDescription _description;
  WorkQueues& _queues;
  AgentLog& _log;
  WorkQueue& _queue;
  FileCopier::Completion _completion;
  ArchiveEnding _ending;
  ArchiveOutcome _outcome;
};

}  // namespace

std::shared_ptr<FileCopierJob> ZipFileCopier::makeJob(std::string input, std::string output,
                                                      std::string identifier, CopierOperation /*operation*/,
                                                      WorkQueue& queue, Completion completion) {
  return std::make_shared<ZipJob>(
      JobDescription{std::move(input), std::move(output), std::move(identifier), _compression, _paths},
      _queues, _log, queue, std::move(completion));
}

}  // namespace zal
