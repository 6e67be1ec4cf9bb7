#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/directory_roots.h"
#include "platform/linux/config/host_environment.h"

namespace zal {

// Where the agent's own files lie on this host. Pure functions of the environment, but for
// configurationFile and preferenceDirectory, which look which file exists.

/// The places that lirra.toml is looked for, best first. `LIRRA_CONFIG` leaves itself alone.
[[nodiscard]] std::vector<std::string> configurationFileCandidates(const HostEnvironment& environment);
/// The lirra.toml to read: the one that LIRRA_CONFIG names, existing or not, else the first that
/// exists; nothing when there is none.
[[nodiscard]] std::optional<std::string> configurationFile(const HostEnvironment& environment);
/// The directory that lirra.toml is in; without one, the directory it would be in: the user's own,
/// or /etc/lirra for a system agent. Preference files lie there too.
[[nodiscard]] std::string preferenceDirectory(const HostEnvironment& environment);

/// The agent's socket: $LIRRA_SOCKET, else com.vendel.lirra in $XDG_RUNTIME_DIR, else in /run for
/// the superuser; nothing when a user has no runtime directory.
[[nodiscard]] std::optional<std::string> socketPath(const HostEnvironment& environment);

/// The roots that do not follow from others: a user's agent has everything below its state
/// directory, a system agent uses the system's directories. Fields that follow are left empty.
[[nodiscard]] DirectoryRoots defaultDirectoryRoots(const HostEnvironment& environment);
/// Fills the roots that are still empty and follow from others: MobileLogRoot is UserLogRoot, each
/// report root lies below its log root.
void fillDependentRoots(DirectoryRoots& roots);

}  // namespace zal
