#pragma once

#include <functional>
#include <string_view>

#include "dump/collection_record.h"
#include "platform/agent_log.h"

namespace zal {

/// Runs what the record's current step is to do. When that throws, the step is given up and has failed: what
/// there is goes into the archive all the same, and the client gets its answer.
void runGuarded(std::string_view name, CollectionRecord& record, AgentLog& log,
                const std::function<void()>& step);

}  // namespace zal
