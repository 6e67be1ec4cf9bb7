#pragma once

#include <string_view>
#include <vector>

#include "session/zal_pair.h"

namespace zal {

/// Appends the texts by ascending time, the later arrival first among equal times. The entries are in
/// order of arrival, their times never NaN. Linear in their number, whatever their order.
void appendInTimeOrder(const std::vector<ZalPair<std::string_view, double>>& entries,
                       std::vector<std::string_view>& texts);

}  // namespace zal
