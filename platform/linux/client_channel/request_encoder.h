#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "platform/client_channel.h"
#include "platform/linux/wire/frame.h"

namespace zal {

/// The request as one frame, in a buffer of the calling thread that its next call uses again.
/// Nothing when it is larger than `largestPayload`.
[[nodiscard]] std::optional<std::string_view> encodeRequest(std::span<const RequestField> fields,
                                                            FrameKind kind, std::uint64_t cookie,
                                                            std::uint32_t largestPayload);
/// The same for a barrier.
[[nodiscard]] std::string_view encodeBarrier(std::uint64_t cookie);

}  // namespace zal
