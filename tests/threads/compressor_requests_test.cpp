#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "dump/log_compressor.h"
#include "tests/support/fake_platform.h"

namespace zal {
namespace {

TEST(LogCompressorThreadsTest, RequestsFromSeveralThreadsAreAllCarriedOut) {
  constexpr int kThreads = 4, kEach = 25;
  testing::FakePlatform host;
  class QuietCopier : public FileCopier {
   public:
    struct Job : FileCopierJob {
      Job(WorkQueue& on, Completion done) : queue(on), completion(std::move(done)) {}
      [[nodiscard]] const std::string& identifier() const override { return name; }
      void endWith(ArchiveEnding /*ending*/) override {}
      void start() override {
        queue.async([this] { completion(*this); });
      }
      std::string name = "/nonexistent/for/a/test";
      WorkQueue& queue;
      Completion completion;
    };
    [[nodiscard]] std::shared_ptr<FileCopierJob> makeJob(std::string, std::string, std::string,
                                                         CopierOperation, WorkQueue& queue,
                                                         Completion completion) override {
      return std::make_shared<Job>(queue, std::move(completion));
    }
  } copier;
  class NoFiles : public testing::PlainFilePlacement {
   public:
    NoFiles() : PlainFilePlacement("/nonexistent") {}
    [[nodiscard]] std::string randomTemporaryPath(std::string_view) override { return "/nonexistent/t"; }
    std::error_code move(const std::string&, const std::string&) override { return {}; }
  } files;
  _LirraLogCompressor shared({.log = host.agentLog, .copier = copier, .files = files, .queues = host.queues});
  std::atomic<int> completions{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < kThreads; ++t) {
    threads.emplace_back([&] {
      for (int i = 0; i < kEach; ++i) shared.compressDirectory("/x", "/x.zip", [&] { ++completions; });
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(shared.runningJobs(), 100U);
  host.queues.runAll();
  EXPECT_EQ(completions.load(), 100);
  EXPECT_EQ(shared.runningJobs(), 0U);
}

}  // namespace
}  // namespace zal
