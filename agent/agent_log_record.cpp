#include "agent/agent_log_record.h"

namespace zal {

void formatAgentLogLine(std::string& line, std::string_view sender, std::string_view category,
                        std::string_view text) {
  // Its length is known, so it is set once: this is done for every record.
  line.resize(sender.size() + category.size() + text.size() + 4);
  char* at = line.data();
  *at++ = '[';
  at += sender.copy(at, sender.size());
  *at++ = ':';
  at += category.copy(at, category.size());
  *at++ = ']';
  *at++ = ' ';
  text.copy(at, text.size());
}

}  // namespace zal
