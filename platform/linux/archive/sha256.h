#pragma once

#include <cstddef>
#include <memory>
#include <string>

struct sha256_ctx;

namespace zal {

/// The SHA-256 of bytes that come piece by piece. Not for several threads.
class Sha256 {
 public:
  Sha256();
  ~Sha256();
  Sha256(const Sha256&) = delete;
  Sha256& operator=(const Sha256&) = delete;

  void add(const char* bytes, std::size_t size);
  /// 64 hexadecimal digits. Begins anew.
  [[nodiscard]] std::string takeDigest();

 private:
  const std::unique_ptr<sha256_ctx> _state;
};

}  // namespace zal
