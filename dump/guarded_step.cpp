#include "dump/guarded_step.h"

#include <exception>
#include <string>

namespace zal {

void runGuarded(std::string_view name, CollectionRecord& record, AgentLog& log,
                const std::function<void()>& step) {
  try {
    step();
  } catch (const std::exception& exception) {
    log.warning("The step \"" + std::string(name) + "\" of a collection was given up: " + exception.what());
    record.stepGives(PartState::failed, exception.what());
  }
}

}  // namespace zal
