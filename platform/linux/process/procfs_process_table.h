#pragma once

#include <string>

#include "platform/process_table.h"

namespace zal {

/// The process file system: one folder a process, its short name in "comm". Processes that end
/// while the table is read are left out.
class ProcfsProcessTable : public ProcessTable {
 public:
  explicit ProcfsProcessTable(std::string root = "/proc");
  [[nodiscard]] std::optional<std::vector<ProcessEntry>> processes() const override;
  [[nodiscard]] std::vector<FileWriter> writersBelow(const std::string& directory) const override;

 private:
  const std::string _root;
};

}  // namespace zal
