#pragma once

#include <string>
#include <string_view>

#include "platform/agent_log.h"
#include "session/buffered_file.h"
#include "session/log_lines.h"

namespace zal {

/// Of a line whose newline follows it in memory, the bytes that stand for it in its file. Plain: nothing in
/// it is beyond ASCII.
[[nodiscard]] std::string_view writtenPart(std::string_view line, bool isPlain);

/// What the disk refused is logged in one warning. Returned: whether it took everything.
bool closeOrWarn(BufferedFile& file, const std::string& path, AgentLog& log);

/// Writes each text as one line of a fresh file. Of a line's UTF-8 form only as many bytes are written
/// as the line, newline included, has UTF-16 units: text beyond ASCII costs the line its end. The
/// readers of these files expect exactly that. What the disk refuses is logged in one warning. Returned:
/// whether it took everything.
bool writeStrings(const LogLines& strings, FilePlacement& files, const std::string& path, AgentLog& log);

}  // namespace zal
