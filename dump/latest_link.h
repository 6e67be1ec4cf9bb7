#pragma once

#include <string>

namespace zal {

class AgentLog;
class FilePlacement;

/// Makes `<log root>/<service>/Latest-<service>` a link to the archive, in place of what stands
/// there. Failures are not reported; a service name that would lead out of the log root is refused
/// with one warning. The root is absolute. Any thread.
void linkLatestArchive(FilePlacement& files, const std::string& logRoot, const std::string& service,
                       const std::string& archive, AgentLog& log);

/// The same for an archive of earlier, unless the link leads to one that is not older. Any thread.
void linkArchiveOfEarlier(FilePlacement& files, const std::string& logRoot, const std::string& service,
                          const std::string& archive, AgentLog& log);

}  // namespace zal
