#pragma once

#include <cstddef>
#include <string>

#include "platform/clock.h"

namespace zal {

class AgentLog;
class WorkQueue;

/// Removes what processes that are gone left in the temporary area at the base and in those beside it, and
/// the areas: those of this user that nobody holds. A file that may not be written any more is no leftover
/// until it is a day old: an archive for which there was no other place. Links go, not what they lead to. An
/// area that is a link or another user's is not touched. Returned: how many entries went. Waits for a disk.
[[nodiscard]] std::size_t removeTemporaryLeftovers(const std::string& base, WallTime now);

/// For a start: does so on the queue one second later, when the first requests have been served,
/// and logs how many went, if any did. Without an area there is nothing to queue. The clock and the
/// log outlive the job.
void removeTemporaryLeftoversLater(WorkQueue& queue, const Clock& clock, AgentLog& log,
                                   const std::string& base);

}  // namespace zal
