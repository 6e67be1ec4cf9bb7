#pragma once

#include <string>
#include <string_view>

#include "dump/collection_record.h"
#include "platform/file_copier.h"

namespace zal {

/// The name of an archive's manifest in it.
inline constexpr std::string_view kManifestName = "Manifest.json";

/// What an archive holds, what it does not and why, as JSON: docs/archives.md. One row a line, in the
/// account's and the archive's order. Pure.
[[nodiscard]] std::string manifestText(const CollectionAccount& account, const ArchiveContent& content,
                                       WallTime archived);

/// "done", "partial", "missing", "failed", "running", "skipped", "not run".
[[nodiscard]] std::string_view partStateText(PartState state);

}  // namespace zal
