#include "platform/linux/client_channel/reply_decoder.h"

#include "platform/linux/wire/flex_conversion.h"
#include "platform/linux/wire/flex_verifier.h"

namespace zal {

std::optional<ValueMap> decodeReply(std::string_view payload) {
  const auto root = verifiedFlexRoot(payload);
  const auto map = root ? root->asMap() : std::nullopt;
  return map ? convertedMap(*map) : std::nullopt;
}

}  // namespace zal
