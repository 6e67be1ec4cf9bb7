#pragma once

#include <string>

namespace zal {

class AgentLog;
class FilePlacement;

/// Makes `<log root>/<service>/Latest-<service>` a link to the archive, in place of what stands
/// there. What fails is tried again at once, then told with one warning, and so is a service name that
/// would lead out of the log root. Without logs of the service there is no link. The root is absolute. Any
/// thread.
void linkLatestArchive(FilePlacement& files, const std::string& logRoot, const std::string& service,
                       const std::string& archive, AgentLog& log);

/// The same for an archive of earlier, unless the link leads to one that is not older. Any thread.
void linkArchiveOfEarlier(FilePlacement& files, const std::string& logRoot, const std::string& service,
                          const std::string& archive, AgentLog& log);

}  // namespace zal
