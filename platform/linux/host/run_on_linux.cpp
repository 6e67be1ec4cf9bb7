#include "platform/linux/host/run_on_linux.h"

#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include "platform/linux/host/command_line.h"
#include "platform/linux/host/linux_platform.h"

namespace zal {
namespace {

constexpr int kCannotStart = 1;
constexpr int kWrongCommandLine = 2;

void overrideVariable(HostEnvironment& environment, const char* name,
                      const std::optional<std::string>& value) {
  if (value) environment.variables[name] = *value;
}

}  // namespace

int runOnLinux(int argc, char** argv, int (*agent)(Platform& platform)) {
  const CommandLine line = CommandLine::parse({argv + (argc > 0 ? 1 : 0), argv + argc});
  if (line.help) {
    std::fputs(CommandLine::helpText().c_str(), stdout);
    return 0;
  }
  if (line.version) {
    std::puts("zalloggingagent " ZAL_VERSION);
    return 0;
  }
  if (line.trouble) {
    std::fprintf(stderr, "zalloggingagent: %s\n", line.trouble->c_str());
    return kWrongCommandLine;
  }
  HostEnvironment environment = HostEnvironment::ofThisProcess();
  overrideVariable(environment, "LIRRA_CONFIG", line.configFile);
  overrideVariable(environment, "LIRRA_SOCKET", line.socketPath);
  try {
    LinuxPlatform platform(environment);
    const int status = agent(platform.services());
    // Not by returning: jobs of other threads may be in the middle of using what would go.
    platform.services().processExit.exit(status);
    return status;
  } catch (const std::exception& exception) {
    // The host has no descriptors or no memory for it. The service manager may try again.
    std::fprintf(stderr, "zalloggingagent: cannot start: %s\n", exception.what());
    return kCannotStart;
  }
}

}  // namespace zal
