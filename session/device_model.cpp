#include "session/device_model.h"

#include "platform/device_registry.h"
#include "session/text_encoding.h"

namespace zal {

std::optional<std::string> deviceModel(DeviceRegistry& registry) {
  const auto bytes = registry.modelBytes();
  if (!bytes) return std::nullopt;
  // The raw property may hold anything behind its NUL.
  std::string text = bytes->substr(0, bytes->find('\0'));
  return isValidUtf8(text) ? std::optional<std::string>(std::move(text)) : std::nullopt;
}

}  // namespace zal
