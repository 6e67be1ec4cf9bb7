#include "dump/copied_logs_alert.h"

#include <filesystem>

namespace zal {

UserAlert copiedLogsAlert(const std::string& title, const std::string& archive) {
  UserAlert alert;
  alert.identifier = "CopyLogs";
  alert.title = title;
  alert.message = "Logs have been successfully captured and stored in this file: " +
                  std::filesystem::path(archive).filename().string();
  alert.defaultButton = "OK";
  return alert;
}

}  // namespace zal
