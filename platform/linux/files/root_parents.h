#pragma once

#include "platform/directory_roots.h"

namespace zal {

/// Makes the missing directories above the roots that the agent writes into, for its user alone. What
/// is made below a root is open to everybody, for several users' daemons write there; the way to it is
/// not. A directory that exists stays as it is, and one that cannot be made shows when it is used.
/// Any thread.
void makeRootParents(const DirectoryRoots& roots);

}  // namespace zal
