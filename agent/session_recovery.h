#pragma once

#include "platform/platform.h"
#include "session/session_services.h"

namespace zal {

/// Writes the log files of every session that an earlier process was cut off in, from the black box. What
/// comes of them is logged. Nothing is collected for them: the device is no longer as it was in the call.
/// Main thread only; before there is a client.
void recoverSessions(Platform& platform, SessionServices& sessionServices);

}  // namespace zal
