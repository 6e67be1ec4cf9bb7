#pragma once

#include "platform/platform.h"

namespace zal {

/// The whole process: follows the command line, puts this host's services together and runs the
/// agent with them. Call it first and once, on the main thread. Returned: the exit status, which is
/// the agent's, 1 when the host lacks what it takes to start, or 2 when the command line made no sense.
int runOnLinux(int argc, char** argv, int (*agent)(Platform& platform));

}  // namespace zal
