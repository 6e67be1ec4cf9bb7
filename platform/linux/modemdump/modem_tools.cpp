#include "platform/linux/modemdump/modem_tools.h"

#include <algorithm>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/linux/files/directory_names.h"
#include "platform/linux/helper/bounded_program.h"

namespace zal::modemdump {
namespace {

struct ControlTool {
  std::string_view driver;  ///< the kernel's, which decides what a device speaks
  const char* program;
  const char* file;
  std::vector<const char*> questions;
};

const std::vector<ControlTool>& controlTools() {
  static const std::vector<ControlTool> kTools = {
      {"qmi_wwan",
       "qmicli",
       "qmi.txt",
       {"--dms-get-revision", "--dms-get-operating-mode", "--nas-get-signal-info", "--nas-get-system-info",
        "--nas-get-cell-location-info"}},
      {"cdc_mbim",
       "mbimcli",
       "mbim.txt",
       {"--query-device-caps", "--query-radio-state", "--query-registration-state", "--query-signal-state",
        "--query-packet-service-state"}},
  };
  return kTools;
}

std::vector<std::string> controlDevices(const std::string& root) {
  auto names = namesIn(root + "/dev");
  std::erase_if(names, [](const std::string& name) { return !name.starts_with("cdc-wdm"); });
  std::sort(names.begin(), names.end());
  return names;
}

std::string driverOf(const std::string& root, const std::string& device) {
  std::error_code error;
  return std::filesystem::read_symlink(root + "/sys/class/usbmisc/" + device + "/device/driver", error)
      .filename()
      .string();
}

/// All answers of one tool about one device, each behind its question.
std::string answers(const ControlTool& tool, const std::string& device, helper::Patience& patience,
                    std::string& trouble) {
  std::string text;
  bool anyAnswer = false;
  for (const char* const question : tool.questions) {
    const auto outcome = helper::runBounded({tool.program, "-p", "-d", device, question}, patience);
    text += "# " + device + " " + question + "\n" + outcome.output + outcome.errors;
    if (!outcome.trouble.empty()) text += "(" + outcome.trouble + ")\n";
    if (outcome.output.empty()) trouble = outcome.trouble;
    anyAnswer = anyAnswer || !outcome.output.empty();
  }
  return anyAnswer ? text : std::string();
}

}  // namespace

void writeToolOutput(const ModemDaemon& daemon, helper::DumpFiles& files, helper::Patience& patience) {
  if (daemon.kind != ModemDaemon::Kind::modemManager) {
    files.missing("mmcli", "not run: ModemManager does not run or does not answer");
    return;
  }
  files.writeOutcome("mmcli.json", "mmcli", helper::runBounded({"mmcli", "-m", "any", "-J"}, patience),
                     false);
}

void writeControlDevices(const std::string& root, helper::DumpFiles& files, helper::Patience& patience) {
  const auto devices = controlDevices(root);
  if (devices.empty()) {
    files.missing("control devices of the modem", "there are none");
    return;
  }
  for (const ControlTool& tool : controlTools()) {
    std::string text, trouble;
    for (const std::string& device : devices) {
      if (driverOf(root, device) == tool.driver)
        text += answers(tool, root + "/dev/" + device, patience, trouble);
    }
    if (!text.empty()) {
      files.write(tool.file, text);
    } else if (!trouble.empty()) {
      files.missing(tool.program, trouble);
    }
  }
}

}  // namespace zal::modemdump
