#pragma once

#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "platform/device_support.h"
#include "platform/dump_progress.h"
#include "platform/file_copier.h"
#include "platform/property_list_writer.h"
#include "platform/radio_coexistence.h"
#include "platform/user_alerts.h"
#include "platform/wifi_diagnostics.h"

namespace zal::testing {

/// Keeps every alert; the test is the person who answers.
class FakeUserAlerts : public UserAlerts {
 public:
  ~FakeUserAlerts() override;
  struct Posted {
    UserAlert alert;
    Listener listener;  ///< empty after it was called
  };
  std::vector<Posted> posted;
  void post(UserAlert alert, Listener listener) override {
    posted.push_back({std::move(alert), std::move(listener)});
  }
  void answer(std::size_t index, const AlertResponse& response) {
    // Taken out first: the answer may lead to another alert.
    if (const auto listener = std::exchange(posted.at(index).listener, nullptr)) listener(response);
  }
};

/// Writes a small text file in place of an archive and completes on the job's queue, unless a test
/// holds the completions back.
class FakeFileCopier : public FileCopier {
 public:
  ~FakeFileCopier() override;
  struct Request {
    std::string input, output, identifier;
    CopierOperation operation;
    bool operator==(const Request&) const = default;
  };
  std::vector<Request> started;
  ArchiveContent content;            ///< what the jobs say that they have archived
  std::vector<std::string> endings;  ///< the texts that archives ended with
  bool writesArchives = true;
  bool holdsBack = false;
  std::vector<std::function<void()>> heldBack;

  [[nodiscard]] std::shared_ptr<FileCopierJob> makeJob(std::string input, std::string output,
                                                       std::string identifier, CopierOperation operation,
                                                       WorkQueue& queue, Completion completion) override {
    return std::make_shared<Job>(
        *this, Request{std::move(input), std::move(output), std::move(identifier), operation}, queue,
        std::move(completion));
  }

 private:
  class Job : public FileCopierJob, public std::enable_shared_from_this<Job> {
   public:
    Job(FakeFileCopier& owner, Request request, WorkQueue& queue, Completion completion)
        : _owner(owner), _request(std::move(request)), _queue(queue), _completion(std::move(completion)) {}
    [[nodiscard]] const std::string& identifier() const override { return _request.identifier; }
    void endWith(ArchiveEnding ending) override { _ending = std::move(ending); }
    void start() override {
      _owner.started.push_back(_request);
      if (_owner.writesArchives && std::filesystem::is_directory(_request.input)) {
        std::ofstream(_request.output) << "archive of " << _request.input;
        if (_ending.text) _owner.endings.push_back(_ending.text(_owner.content));
      }
      const auto complete = [this, weak = weak_from_this()] {
        // As the real one: whoever let go of the job hears nothing.
        if (const auto self = weak.lock()) _completion(*self);
      };
      if (_owner.holdsBack) {
        _owner.heldBack.emplace_back([this, complete] { _queue.async(complete); });
      } else {
        _queue.async(complete);
      }
    }

   private:
    FakeFileCopier& _owner;
    Request _request;
    WorkQueue& _queue;
    Completion _completion;
    ArchiveEnding _ending;
  };
};

class FakeDeviceSupport : public DeviceSupport {
 public:
  ~FakeDeviceSupport() override;
  std::string name;
  bool videoCallsOverCellular = false;
  [[nodiscard]] std::string deviceName() override { return name; }
  [[nodiscard]] bool videoCallsOverCellularAvailable() override { return videoCallsOverCellular; }
};

/// Completes inside the call unless a test holds the completions back.
class FakeWifiDiagnostics : public WifiDiagnostics {
 public:
  ~FakeWifiDiagnostics() override;
  struct Taken {
    std::string directory, reason;
    bool operator==(const Taken&) const = default;
  };
  std::vector<Taken> taken;
  int result = 0;
  bool holdsBack = false;
  std::vector<Completion> heldBack;
  void takeDump(const std::string& directory, const std::string& reason, Completion completion) override {
    taken.push_back({directory, reason});
    if (holdsBack) {
      heldBack.push_back(std::move(completion));
    } else {
      completion(result);
    }
  }
};

class FakeRadioCoexistence : public RadioCoexistence {
 public:
  ~FakeRadioCoexistence() override;
  bool present = false;
  std::function<void()> whenDumped;
  int lookUps = 0;
  int dumps = 0;
  [[nodiscard]] std::function<void()> logDumpEntryPoint() override {
    ++lookUps;
    if (!present) return {};
    return [this] {
      ++dumps;
      if (whenDumped) whenDumped();
    };
  }
};

/// Writes "key = value" lines where the real one writes XML.
class FakePropertyListWriter : public PropertyListWriter {
 public:
  ~FakePropertyListWriter() override;
  std::vector<std::pair<std::string, ValueMap>> written;
  std::error_code write(const ValueMap& dictionary, const std::string& path) override {
    written.emplace_back(path, dictionary);
    std::ofstream file(path);
    for (const auto& [key, value] : dictionary) file << key << "\n";
    return file ? std::error_code{} : std::make_error_code(std::errc::io_error);
  }
};

/// Keeps what was told as lines: "BEGIN Vistel /dir", "STEP 1 name", "MISSING what: why", "OK path",
/// "FAILED reason".
class RecordingDumpProgress : public DumpProgressRecords {
 public:
  ~RecordingDumpProgress() override;
  std::vector<std::string> lines;
  std::vector<DumpPlan> plans;
  std::vector<CutOffDump> cutOffDumps;
  [[nodiscard]] std::vector<CutOffDump> cutOff() override { return cutOffDumps; }
  [[nodiscard]] std::shared_ptr<DumpProgress> begin(DumpPlan plan) override {
    lines.push_back("BEGIN " + plan.service + " " + plan.directory);
    plans.push_back(plan);
    return std::make_shared<Record>(lines, std::move(plan));
  }

 private:
  class Record : public DumpProgress {
   public:
    Record(std::vector<std::string>& lines, DumpPlan plan) : _lines(lines), _plan(std::move(plan)) {}
    void step(std::size_t number) override {
      _lines.push_back("STEP " + std::to_string(number) + " " + _plan.steps.at(number - 1));
    }
    void missing(std::string_view what, std::string_view why) override {
      _lines.push_back("MISSING " + std::string(what) + ": " + std::string(why));
    }
    void done(const std::string& archivePath) override { _lines.push_back("OK " + archivePath); }
    void failed(std::string_view reason) override { _lines.push_back("FAILED " + std::string(reason)); }

   private:
    std::vector<std::string>& _lines;
    DumpPlan _plan;
  };
};

}  // namespace zal::testing
