#pragma once

#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/file_placement.h"
#include "platform/kept_store.h"

namespace zal {

/// What is kept, found and removed by handles of the directories it lies in: a link below a root is never
/// followed, and what belongs to another user is not seen. An archive is in use while anybody has it open or
/// locked, a directory while it is locked; both while a living agent's progress record names them.
class FileKeptStore final : public KeptStore {
 public:
  struct Places {
    std::string reports;        ///< sessions and dumps lie below
    std::string userLogs;       ///< TYPE/Latest-TYPE in it lead to archives that stay
    std::string blackBox;       ///< records, and lines of long sessions in files without a name
    std::string progress;       ///< of collections
    std::string temporaryArea;  ///< the base, in the reports' directory
  };
  /// Stubs come from a temporary path of the placement, which outlives the store.
  FileKeptStore(Places places, FilePlacement& files);

  [[nodiscard]] DiskRoom room() const override;
  [[nodiscard]] std::vector<KeptItem> items() override;
  void findFailed(std::vector<KeptItem>& items) override;
  std::error_code remove(const KeptItem& item) override;

 private:
  void _addRecords(std::vector<KeptItem>& items) const;
  void _addSpilledLines(std::vector<KeptItem>& items) const;
  void _addTemporary(int reports, std::vector<KeptItem>& items) const;
  [[nodiscard]] bool _leaveStub(int directory, const std::string& archive, std::string_view manifest);

  const Places _places;
  FilePlacement& _files;
};

}  // namespace zal
