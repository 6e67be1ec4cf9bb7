#include "platform/linux/tessel/tessel.h"

int main(int argc, char** argv) { return zal::tessel::run({argv + (argc > 0 ? 1 : 0), argv + argc}); }
