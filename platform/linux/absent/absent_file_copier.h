#pragma once

#include <filesystem>
#include <utility>

#include "platform/agent_log.h"
#include "platform/file_copier.h"

namespace zal {

/// For a host that cannot make archives: the input is moved aside, so that it stays. Any thread.
class AbsentFileCopier : public FileCopier {
 public:
  explicit AbsentFileCopier(AgentLog& log) : _log(log) {}
  [[nodiscard]] std::shared_ptr<FileCopierJob> makeJob(std::string input, std::string /*output*/,
                                                       std::string identifier, CopierOperation /*operation*/,
                                                       WorkQueue& queue, Completion completion) override {
    struct Job : FileCopierJob, std::enable_shared_from_this<Job> {
      Job(AgentLog& agentLog, std::string input, std::string name, WorkQueue& where, Completion then)
          : log(agentLog), from(std::move(input)), id(std::move(name)), queue(where), done(std::move(then)) {}
      [[nodiscard]] const std::string& identifier() const override { return id; }
      void start() override {
        std::error_code error;
        std::filesystem::rename(from, from + " (not archived)", error);
        log.warning("There is nothing here that makes archives; \"" + from + "\" was " +
                    (error ? "left: " + error.message() : "moved aside"));
        queue.async([self = shared_from_this()] { self->done(*self); });
      }
      AgentLog& log;
      std::string from, id;
      WorkQueue& queue;
      Completion done;
    };
    return std::make_shared<Job>(_log, std::move(input), std::move(identifier), queue, std::move(completion));
  }

 private:
  AgentLog& _log;
};

}  // namespace zal
