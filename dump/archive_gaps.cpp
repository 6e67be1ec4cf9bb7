#include "dump/archive_gaps.h"

#include <filesystem>

#include "collectors/missing_output.h"
#include "dump/collection_record.h"
#include "platform/agent_log.h"
#include "platform/process_table.h"
#include "platform/standard_path.h"

namespace zal {

void tellRunningCommands(const std::string& directory, const ProcessTable& processes, AgentLog& log,
                         CollectionRecord& record) {
  const std::string below = resolveAndStandardize(directory, "");
  for (const FileWriter& writer : processes.writersBelow(below)) {
    const std::string file = std::filesystem::path(writer.file).lexically_relative(below).string();
    log.notice("Still running when archived: " + writer.command + " (process " +
               std::to_string(writer.processId) + "), writing " + writer.file);
    record.output(file, PartState::running, "still running when archived: " + writer.command);
  }
}

void tellMissingPrograms(const std::string& directory, CollectionRecord& record) {
  for (const MissingOutput& output : missingOutputs(directory)) {
    record.output(output.file, PartState::missing, output.missing.program + ": " + output.missing.reason);
  }
}

}  // namespace zal
