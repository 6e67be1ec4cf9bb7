#pragma once

#include <algorithm>
#include <string>

#include "platform/configuration.h"

namespace zal {

/// The report server as a part of the names of ping results; "reportHost" where none is configured.
[[nodiscard]] inline std::string reportHostInFileNames(const Endpoints& endpoints) {
  if (endpoints.reportServer.empty()) return "reportHost";
  std::string name = endpoints.reportServer;
  std::replace(name.begin(), name.end(), '/', '_');
  return name;
}

}  // namespace zal
