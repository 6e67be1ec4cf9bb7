#include "platform/linux/archive/sha256.h"

#include <nettle/sha2.h>

#include <array>

namespace zal {

Sha256::Sha256() : _state(std::make_unique<sha256_ctx>()) { ::sha256_init(_state.get()); }

Sha256::~Sha256() = default;

void Sha256::add(const char* bytes, std::size_t size) {
  ::sha256_update(_state.get(), size, reinterpret_cast<const std::uint8_t*>(bytes));
}

std::string Sha256::takeDigest() {
  constexpr const char* kDigits = "0123456789abcdef";
  std::array<std::uint8_t, SHA256_DIGEST_SIZE> digest{};
  ::sha256_digest(_state.get(), digest.size(), digest.data());
  std::string text;
  for (const std::uint8_t byte : digest) {
    text += kDigits[byte >> 4U];
    text += kDigits[byte & 15U];
  }
  return text;
}

}  // namespace zal
