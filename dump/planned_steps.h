#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "dump/collection_record.h"

namespace zal {

struct Platform;

/// Why a step that needs one of the flags is skipped: "flag 0x1000 is not set".
[[nodiscard]] std::string flagsNotSet(CollectionFlags anyOf);

/// Why a big step is skipped while the disk has no room for it. lirractl counts it among what is missing.
inline constexpr std::string_view kOverBudget = "over budget";

/// The names of those that are wanted, in order.
[[nodiscard]] std::vector<std::string> wantedNames(const std::vector<PlannedStep>& steps);

/// Begins the record of a collection: the progress record with the wanted steps, and the account, which
/// hears from now on what is gathered into the plan's directory. Never empty.
[[nodiscard]] std::shared_ptr<CollectionRecord> beginRecord(Platform& platform, GatheringWitnesses& witnesses,
                                                            CollectionRecord::Plan plan);

}  // namespace zal
