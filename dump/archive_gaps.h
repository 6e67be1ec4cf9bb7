#pragma once

#include <string>

namespace zal {

class AgentLog;
class CollectionRecord;
class ProcessTable;

/// Says in the log and in the record which commands still write below the directory, one line each:
/// what they write from now on will not be archived. Any thread.
void tellRunningCommands(const std::string& directory, const ProcessTable& processes, AgentLog& log,
                         CollectionRecord& record);
/// Says in the record which outputs below the directory hold nothing for the want of a program, one
/// line each. Any thread; reads from a disk.
void tellMissingPrograms(const std::string& directory, CollectionRecord& record);

}  // namespace zal
