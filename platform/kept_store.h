#pragma once

#include <system_error>
#include <vector>

#include "platform/kept_item.h"

namespace zal {

/// What the agent has on the disk. Any thread, but one at a time; waits for a disk unless it says otherwise.
class KeptStore {
 public:
  virtual ~KeptStore() = default;
  /// Does not wait.
  [[nodiscard]] virtual DiskRoom room() const = 0;
  /// Everything of this user, in no order. Whether a call failed is not known yet.
  [[nodiscard]] virtual std::vector<KeptItem> items() = 0;
  /// Finds out which sessions failed, from the beginnings of their logs.
  virtual void findFailed(std::vector<KeptItem>& items) = 0;
  /// Removes one of the items with all below it; an archive leaves its manifest as a stub, if it has one.
  /// Returned: why it is still there, or not all gone; device_or_resource_busy when it is in use by now.
  virtual std::error_code remove(const KeptItem& item) = 0;
};

}  // namespace zal
