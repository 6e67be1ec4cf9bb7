#pragma once

#include "platform/dump_progress.h"

namespace zal {

/// For a host without a place for records: nobody watches. Any thread.
class AbsentDumpProgress : public DumpProgressRecords {
 public:
  [[nodiscard]] std::shared_ptr<DumpProgress> begin(DumpPlan /*plan*/) override {
    struct Unwatched : DumpProgress {
      void step(std::size_t) override {}
      void missing(std::string_view, std::string_view) override {}
      void done(const std::string&) override {}
      void failed(std::string_view) override {}
    };
    return std::make_shared<Unwatched>();
  }
};

}  // namespace zal
