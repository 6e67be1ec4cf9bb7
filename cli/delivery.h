#pragma once

#include <functional>

#include "cli/tool_context.h"
#include "client/lirra.hpp"

namespace zal {

/// A client for this run's agent, which may be unusable: lirra::Client's operator bool says.
[[nodiscard]] lirra::Client openClient(ToolContext& tool);
/// Waits for the agent's confirmation, and before for the agent where --wait was given.
[[nodiscard]] lirra::Result confirm(ToolContext& tool, lirra::Client& client);
/// Says what a result other than LIRRA_OK means here and what to do.
ExitCode failToDeliver(ToolContext& tool, lirra::Result result, const lirra::Client& client);

/// Makes one request and waits until the agent has handled it.
ExitCode deliver(ToolContext& tool, const std::function<lirra::Result(lirra::Client&)>& request);

/// How an agent is started here, as a hint.
[[nodiscard]] std::string startHint(ToolContext& tool);

}  // namespace zal
