#pragma once

#include <cstddef>
#include <string>

#include "platform/clock.h"

namespace zal {

class AgentLog;
class WorkQueue;

/// Removes what earlier runs left in the temporary area: its own entries, with all below them, that were last
/// changed more than a day before now; and files that may be written, that nobody writes, and that were last
/// changed before this run started. Links go, not what they lead to. An area that is a link or another user's
/// is not touched. Returned: how many entries went. Waits for a disk.
[[nodiscard]] std::size_t removeTemporaryLeftovers(const std::string& area, WallTime now, WallTime startedAt);

/// For a start: does so on the queue one second later, when the first requests have been served,
/// and logs how many went, if any did. Without an area there is nothing to queue. The clock and the
/// log outlive the job.
void removeTemporaryLeftoversLater(WorkQueue& queue, const Clock& clock, AgentLog& log,
                                   const std::string& area);

}  // namespace zal
