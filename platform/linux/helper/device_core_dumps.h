#pragma once

#include <cstdint>
#include <string>

#include "platform/linux/helper/dump_files.h"
#include "platform/linux/helper/patience.h"

namespace zal::helper {

/// Of all device core dumps together; a modem's memory is tens of mebibytes.
inline constexpr std::uint64_t kMostCoreBytes = std::uint64_t{128} << 20U;

/// What drivers kept of a device that broke (`/sys/class/devcoredump/*/data` below the root, which is
/// empty but for tests): "devcore.bin", "devcore-2.bin" and so on. The kernel keeps each for some
/// minutes; reading does not remove it.
void copyDeviceCoreDumps(const std::string& root, DumpFiles& files, Patience& patience);

}  // namespace zal::helper
