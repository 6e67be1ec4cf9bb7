#include <string>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/alerts/alert_record.h"
#include "platform/linux/dialog/dialog_command.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

void readRecord(std::string_view text) {
  const auto record = parseAlertRecord(text);
  if (!record) return;
  const std::string written = alertRecordText(*record);
  const auto again = parseAlertRecord(written);
  promise(again.has_value(), "a record that was read can be written as one");
  promise(alertRecordText(*again) == written, "and is read as it was");
  promise(isUtf8(written), "a record is text");
}

void readAnswer(std::string_view text) {
  std::string reason;
  const auto answer = parseAlertAnswer(text, reason);
  promise(answer.has_value() || !reason.empty(), "who is refused hears why");
  promise(reason.find('\n') == std::string::npos, "in one line");
  if (!answer) return;
  promise(answer->code >= AlertResponse::kDefaultButton && answer->code <= AlertResponse::kCancelled,
          "a button is one of four");
  const auto again = parseAlertAnswer(alertAnswerText(*answer), reason);
  promise(again && again->code == answer->code && again->text == answer->text, "an answer is read as it was");
}

/// A program's output and, behind the first zero, its errors.
void readDialog(int status, std::string_view said) {
  const std::size_t zero = said.find('\0');
  const DialogOutcome outcome{
      status, std::string(said.substr(0, zero)),
      zero == std::string_view::npos ? std::string() : std::string(said.substr(zero + 1))};
  for (const DialogProgram program : {DialogProgram::zenity, DialogProgram::kdialog}) {
    for (const bool hasField : {false, true}) {
      UserAlert alert{.title = "T", .message = "M", .defaultButton = "Yes", .alternateButton = "No"};
      if (hasField) alert.textField = UserAlert::TextField{"Name", ""};
      if (program == DialogProgram::zenity) alert.otherButton = "Later";
      std::string reason;
      const auto answer = dialogAnswer(program, alert, outcome, reason);
      promise(answer.has_value() || !reason.empty(), "what is no answer has a reason");
      promise(reason.find('\n') == std::string::npos, "in one line");
      if (!answer) continue;
      promise(alertHasButton(alert, answer->code), "the alert has the button");
      promise(hasField || !answer->text, "only what was asked for is answered");
    }
  }
}

}  // namespace

void fuzzAlert(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return;
  const std::string text(reinterpret_cast<const char*>(data + 1), size - 1);
  switch (data[0]) {
    case 0:
      return readRecord(text);
    case 1:
      return readAnswer(text);
    default:
      return readDialog(static_cast<std::int8_t>(data[0] - 2), text);
  }
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzAlert(data, size);
  return 0;
}
#endif
