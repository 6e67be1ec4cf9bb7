#include "collectors/file_url.h"

namespace zal {

std::string fileUrl(std::string_view path) {
  constexpr std::string_view kPlain =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-._~!$&'()*+,;=:@/";
  constexpr std::string_view kHex = "0123456789ABCDEF";
  std::string url = "file://";
  for (const char c : path) {
    if (kPlain.find(c) != std::string_view::npos) {
      url += c;
      continue;
    }
    const auto byte = static_cast<unsigned char>(c);
    url += '%';
    url += kHex[byte >> 4U];
    url += kHex[byte & 15U];
  }
  return url;
}

}  // namespace zal
