#include "platform/linux/log/rotation_names.h"

#include <charconv>

namespace zal {
namespace {

constexpr std::string_view kPending = ".pending-";
constexpr std::string_view kReady = ".ready-";
constexpr std::string_view kZip = ".zip";
constexpr std::string_view kUnfinished = ".zip.tmp";

using Kind = RotationLeftover::Kind;

std::optional<RotationLeftover> parseNumbered(std::string_view name, std::string_view mark, Kind kind) {
  const std::size_t at = name.rfind(mark);
  if (at == std::string_view::npos || !name.substr(0, at).ends_with(".log")) return std::nullopt;
  const std::string_view digits = name.substr(at + mark.size());
  std::uint64_t sequence = 0;
  const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), sequence);
  if (error != std::errc() || end != digits.data() + digits.size()) return std::nullopt;
  // "7", never "07": a name is taken only if it would be made again the same.
  if (std::to_string(sequence) != digits) return std::nullopt;
  return RotationLeftover{kind, std::string(name.substr(0, at)), sequence};
}

}  // namespace

std::string pendingName(std::string_view fileName, std::uint64_t sequence) {
  return std::string(fileName).append(kPending) + std::to_string(sequence);
}

std::string readyName(std::string_view fileName, std::uint64_t sequence) {
  return std::string(fileName).append(kReady) + std::to_string(sequence) + std::string(kZip);
}

std::string generationName(std::string_view fileName, int generation) {
  return std::string(fileName) + "." + std::to_string(generation) + std::string(kZip);
}

std::string unfinishedZipName(std::string_view fileName) { return std::string(fileName).append(kUnfinished); }

std::optional<RotationLeftover> parseRotationLeftover(std::string_view name) {
  if (name.ends_with(kUnfinished)) {
    const std::string_view fileName = name.substr(0, name.size() - kUnfinished.size());
    if (!fileName.ends_with(".log")) return std::nullopt;
    return RotationLeftover{Kind::unfinishedZip, std::string(fileName)};
  }
  if (name.ends_with(kZip))
    return parseNumbered(name.substr(0, name.size() - kZip.size()), kReady, Kind::ready);
  return parseNumbered(name, kPending, Kind::pending);
}

}  // namespace zal
