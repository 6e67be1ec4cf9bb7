#pragma once

#include <sys/types.h>

#include <string>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// Opens the file for writing, for names that others know beforehand in directories that they write to.
/// It is this user's own plain file with that one name, or made now; what else had the name loses it: a
/// link (never what it leads to), another user's file, one that has a second name elsewhere. The mode is for
/// a file that is made, less the umask; the content of one that was there stays. A device is opened as it is.
/// In a sticky directory nobody else can change any of this afterwards. Any thread. Not open: errno says why;
/// EEXIST or EPERM when what somebody else put there cannot be removed.
[[nodiscard]] Descriptor openOwnFile(const std::string& path, mode_t mode);
/// The same with the path relative to an open directory.
[[nodiscard]] Descriptor openOwnFileAt(int directory, const std::string& path, mode_t mode);

}  // namespace zal
