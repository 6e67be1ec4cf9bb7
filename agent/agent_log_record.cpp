#include "agent/agent_log_record.h"

namespace zal {

void formatAgentLogLine(std::string& line, std::string_view sender, std::string_view category,
                        std::string_view text) {
  line.clear();
  line.append("[").append(sender).append(":").append(category).append("] ").append(text);
}

}  // namespace zal
