#include <iostream>
#include <string>
#include <vector>

#include "cli/host.h"
#include "cli/tool.h"

int main(int argc, char** argv) {
  const std::vector<std::string> arguments(argv + (argc > 0 ? 1 : 0), argv + argc);
  const auto host = zal::thisMachine(std::cerr);
  return zal::runTool(arguments, *host, std::cin, std::cout, std::cerr);
}
