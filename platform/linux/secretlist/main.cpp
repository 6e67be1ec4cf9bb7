#include "platform/linux/secretlist/secretlist.h"

int main(int argc, char** argv) { return zal::secretlist::run({argv + (argc > 0 ? 1 : 0), argv + argc}); }
