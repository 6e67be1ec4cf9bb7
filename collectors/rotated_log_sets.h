#pragma once

#include <string>
#include <vector>

namespace zal {

class AgentLog;
class FileCollector;
struct DirectoryRoots;

/// Links log sets of UserLogRoot into the destination, one directory a set: the current log and
/// event log with the three newest generations of the one and the newest of the other, or all nine
/// of both. What is missing or taken is passed over. The destination is made when missing.
///
/// A set is named by a client in the end: a name that is no plain file name (a slash, ".", "..", a
/// NUL) is refused with one warning, and the others go on. Any thread.
void LinkRotatedLogSets(FileCollector& collector, const DirectoryRoots& roots, AgentLog& log,
                        const std::vector<std::string>& names, const std::string& destination,
                        bool includeAllGenerations);

/// The same without the older generations.
void LinkRecentLogSets(FileCollector& collector, const DirectoryRoots& roots, AgentLog& log,
                       const std::vector<std::string>& names, const std::string& destination);

}  // namespace zal
