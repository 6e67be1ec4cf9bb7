#include "platform/kept_item.h"

#include <algorithm>

namespace zal {
namespace {

constexpr std::string_view kArchiveEnding = ".zip";
constexpr std::string_view kStubEnding = ".Manifest.json";
constexpr std::string_view kNotArchived = " (not archived)";
constexpr std::string_view kDumpMark = "-Log (";
/// '0' stands for any digit.
constexpr std::string_view kDate = "0000-00-00 at 00-00-00 (";

bool beginsWithDate(std::string_view text) {
  return text.size() > kDate.size() &&
         std::equal(kDate.begin(), kDate.end(), text.begin(), [](char want, char have) {
           return want == '0' ? have >= '0' && have <= '9' : have == want;
         });
}

bool isSessionName(std::string_view name) {
  return beginsWithDate(name) && (name.ends_with(") (Initiator)") || name.ends_with(") (Receiver)"));
}

bool isDumpName(std::string_view name) {
  for (std::size_t at = name.find(kDumpMark); at != std::string_view::npos;
       at = name.find(kDumpMark, at + 1)) {
    if (beginsWithDate(name.substr(at + kDumpMark.size()))) return true;
  }
  return false;
}

bool takeEnding(std::string_view& name, std::string_view ending) {
  if (!name.ends_with(ending)) return false;
  name.remove_suffix(ending.size());
  return true;
}

/// " (not archived)", or with "-2" and so on behind it.
void takeNotArchived(std::string_view& name) {
  const std::size_t at = name.rfind(kNotArchived);
  if (at == std::string_view::npos) return;
  const std::string_view number = name.substr(at + kNotArchived.size());
  if (!number.empty() && (number[0] != '-' || number.find_first_not_of("0123456789", 1) != number.npos))
    return;
  name = name.substr(0, at);
}

}  // namespace

std::string_view keptKindText(KeptKind kind) {
  switch (kind) {
    case KeptKind::session:
      return "session";
    case KeptKind::dump:
      return "dump";
    case KeptKind::stub:
      return "stub";
    case KeptKind::record:
      return "record";
    case KeptKind::temporary:
      return "temporary";
  }
  return "";
}

std::optional<KeptName> keptNameOf(std::string_view name) {
  const bool isStub = takeEnding(name, kStubEnding);
  const bool isArchive = !isStub && takeEnding(name, kArchiveEnding);
  if (!isStub && !isArchive) takeNotArchived(name);
  const bool isSession = isSessionName(name);
  if (!isSession && !isDumpName(name)) return std::nullopt;
  return KeptName{isStub ? KeptKind::stub : isSession ? KeptKind::session : KeptKind::dump, isArchive};
}

std::string stubPathOf(std::string_view archive) {
  takeEnding(archive, kArchiveEnding);
  return std::string(archive).append(kStubEnding);
}

}  // namespace zal
