#pragma once

#include <algorithm>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "platform/kept_store.h"

namespace zal::testing {

/// What is kept as a test lays it out; a disk of which nothing can be told unless it says so. What goes makes
/// room.
class FakeKeptStore : public KeptStore {
 public:
  ~FakeKeptStore() override;
  std::vector<KeptItem> kept;
  std::set<std::string> failedCalls;                ///< paths
  std::map<std::string, std::error_code> refusals;  ///< paths that cannot be removed, and why
  DiskRoom disk;
  int looks = 0;
  int failureLooks = 0;

  [[nodiscard]] DiskRoom room() const override { return disk; }
  [[nodiscard]] std::vector<KeptItem> items() override {
    ++looks;
    return kept;
  }
  void findFailed(std::vector<KeptItem>& items) override {
    ++failureLooks;
    for (KeptItem& item : items) item.hasFailed = failedCalls.contains(item.path);
  }
  std::error_code remove(const KeptItem& item) override {
    if (const auto refusal = refusals.find(item.path); refusal != refusals.end()) return refusal->second;
    std::erase_if(kept, [&](const KeptItem& one) { return one.path == item.path; });
    disk.free += item.bytes;
    return {};
  }
};

}  // namespace zal::testing
