#pragma once

#include <string>
#include <string_view>

#include "platform/clock.h"

namespace zal::stackshot {

// Names of report files. The collectors of a dump find them by prefix, one separator and the stamp
// "yyyy-MM-dd-HHmmss", so the stamp is always the local time of the report's begin.

/// "mediaserver-2026-11-21-205910.crash". A process may give itself any name: what cannot stand in a
/// file's name, or would hide the file, becomes "_".
[[nodiscard]] std::string crashReportName(std::string_view process, const LocalTime& begin);

/// "Homeframe+2026-11-21-205910.stackshot". Of the prefixes that belong to snapshots, Homeframe is the
/// one that no other collector looks for: a dump takes its own stackshot and never an older one. The
/// plus sign sorts before the "-" of the crash reports, and of one prefix only the first is taken.
[[nodiscard]] std::string stackshotName(const LocalTime& begin);

/// The name's next variant, its stamp in place: "...-2.crash", "...-3.crash".
[[nodiscard]] std::string variantOf(const std::string& name, int number);

}  // namespace zal::stackshot
