#include "agent/agent_entry.h"
#include "platform/linux/host/run_on_linux.h"

int main(int argc, char** argv) { return zal::runOnLinux(argc, argv, zal::runAgent); }
