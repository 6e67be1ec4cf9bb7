#include <exception>
#include <iostream>

#include "platform/linux/modemdump/modemdump.h"

int main(int argc, char** argv) {
  try {
    return zal::modemdump::run({argv + (argc > 0 ? 1 : 0), argv + argc});
  } catch (const std::exception& trouble) {
    std::cerr << "lirra-modemdump: " << trouble.what() << std::endl;
    return 3;
  }
}
