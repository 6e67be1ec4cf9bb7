#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "platform/ipc_peer.h"
#include "platform/value.h"

namespace zal {

/// Everything that one dump for a user needs to know, taken when it was asked for.
struct DumpRequest {
  std::string sessionType;
  std::string dumpTimeText;  ///< when it was asked for, as directory names show it
  ValueMap userInfo;
  std::string bugReportComponent;
  std::string bugReportComponentVersion;
  std::optional<std::uint64_t> replyToken;  ///< of the request message; none: nobody waits for a reply
  std::shared_ptr<PeerConnection> peer;     ///< may be empty
  std::uint32_t collectionFlags = 0;
  bool showCompletionAlert = false;
  bool fileReport = false;
};

}  // namespace zal
