#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "dump/dump_request.h"

namespace zal {

/// The number of the action that makes a dump for a user, repeated in its reply.
inline constexpr std::int64_t kUserDumpAction = 14;

/// {"action": 14, "replyResult": {"logPath": archive, "replyAction": 14}}; without an archive there
/// is no "logPath".
[[nodiscard]] ValueMap dumpReply(const std::optional<std::string>& archive);

/// Answers whoever asked for the dump. Does nothing when the message expected no reply or its sender
/// is gone.
void sendDumpReply(const DumpRequest& request, const std::optional<std::string>& archive);

}  // namespace zal
