#include "platform/main_thread_check.h"

#ifndef NDEBUG
#include <cstdlib>
#include <iostream>

namespace zal {

void MainThreadCheck::check(std::string_view object, const char* operation) const {
  if (std::this_thread::get_id() == _owner) return;
  std::cerr << object << " belongs to thread " << _owner << " but " << operation << " was called on thread "
            << std::this_thread::get_id() << '\n';
  std::abort();
}

}  // namespace zal
#endif
