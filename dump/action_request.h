#pragma once

#include <cstdint>
#include <memory>

#include "platform/ipc_peer.h"
#include "session/optional_text.h"

namespace zal {

/// One action that a client asks for. Borrowed for the call.
struct ActionRequest {
  std::int64_t action = 0;
  OptionalText session;
  OptionalText sender;
  const std::shared_ptr<PeerConnection>& peer;  ///< may be empty
  const Message* request = nullptr;             ///< the message to reply to; may be absent
  const ValueMap* userInfo = nullptr;           ///< may be absent
};

}  // namespace zal
