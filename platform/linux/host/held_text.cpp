#include "platform/linux/host/held_text.h"

#include <cxxabi.h>

#include <cstdlib>
#include <memory>

namespace zal {
namespace {

std::string readable(std::string_view name) {
  const std::string mangled(name);
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> text(
      abi::__cxa_demangle(mangled.c_str(), nullptr, nullptr, &status), &std::free);
  std::string result = status == 0 && text ? text.get() : mangled;
  constexpr std::string_view kOurs = "zal::";
  for (std::size_t at = 0; (at = result.find(kOurs, at)) != std::string::npos;)
    result.erase(at, kOurs.size());
  return result;
}

}  // namespace

std::string heldText(std::string_view kind, std::string_view name, std::chrono::milliseconds held) {
  std::string text = "The main thread was held for " + std::to_string(held.count()) + " ms: ";
  text += kind;
  if (!name.empty()) text.append(" ").append(readable(name));
  return text;
}

}  // namespace zal
