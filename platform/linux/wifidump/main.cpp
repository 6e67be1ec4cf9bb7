#include <exception>
#include <iostream>

#include "platform/linux/wifidump/wifidump.h"

int main(int argc, char** argv) {
  try {
    return zal::wifidump::run({argv + (argc > 0 ? 1 : 0), argv + argc});
  } catch (const std::exception& trouble) {
    std::cerr << "lirra-wifidump: " << trouble.what() << std::endl;
    return 3;
  }
}
