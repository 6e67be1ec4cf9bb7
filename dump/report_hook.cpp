#include "dump/report_hook.h"

namespace zal {

int FileReportHook(const std::optional<std::string>& /*description*/, const std::string& /*component*/,
                   const std::string& /*componentVersion*/, const std::vector<std::string>& /*archives*/) {
  return 0;
}

}  // namespace zal
