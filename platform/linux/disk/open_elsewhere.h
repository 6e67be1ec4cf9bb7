#pragma once

namespace zal {

/// Whether somebody has the file locked, or has it open besides this descriptor, in this process or another.
/// A file that the kernel tells nothing about (another user's, on some network file systems) counts as not
/// open. The descriptor is open for reading. Any thread.
[[nodiscard]] bool isOpenElsewhere(int file);

}  // namespace zal
