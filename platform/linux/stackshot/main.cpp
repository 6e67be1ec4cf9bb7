#include "platform/linux/stackshot/stackshot.h"

int main(int argc, char** argv) { return zal::stackshot::run({argv + (argc > 0 ? 1 : 0), argv + argc}); }
