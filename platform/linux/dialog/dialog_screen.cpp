#include "platform/linux/dialog/dialog_screen.h"

#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/linux/process/child_environment.h"

namespace zal {

DialogScreen::~DialogScreen() { agentEnds(); }

void DialogScreen::present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) {
  if (!_options.hasDisplay) {
    handlers.onDeclined();
    return;
  }
  _waiting.push_back({id, alert, std::move(handlers)});
  _openNext();
}

void DialogScreen::_openNext() {
  while (!_waiting.empty() && _shown.size() < kMostAtOnce) {
    Turn turn = std::move(_waiting.front());
    _waiting.pop_front();
    _open(std::move(turn));
  }
}

void DialogScreen::_open(Turn turn) {
  std::string reason;
  auto process = _start(turn.id, turn.alert, reason);
  if (process == nullptr) {
    _complain(reason);
    turn.handlers.onDeclined();
    return;
  }
  _shown.insert_or_assign(turn.id,
                          Shown{std::move(turn.alert), std::move(turn.handlers), std::move(process)});
}

std::shared_ptr<DialogProcess> DialogScreen::_start(const std::string& id, const UserAlert& alert,
                                                    std::string& reason) {
  reason = "neither zenity nor kdialog can show it";
  for (const DialogProgram program : {DialogProgram::zenity, DialogProgram::kdialog}) {
    auto words = dialogArguments(program, alert);
    if (!words) continue;
    const std::string& name = program == DialogProgram::zenity ? _options.zenity : _options.kdialog;
    words->insert(words->begin(), name);
    auto process = std::make_shared<DialogProcess>(_context);
    const int error =
        process->start(std::move(*words), dialogEnvironment(ChildEnvironment().variables()),
                       [this, id, program](const DialogOutcome& outcome) { _takeEnd(id, program, outcome); });
    if (error == 0) return process;
    if (error != ENOENT) reason = name + ": " + std::generic_category().message(error);
  }
  return nullptr;
}

void DialogScreen::_takeEnd(const std::string& id, DialogProgram program, const DialogOutcome& outcome) {
  const auto over = _shown.extract(id);
  if (over.empty()) return;
  Shown& shown = over.mapped();
  std::string reason;
  const auto answer = dialogAnswer(program, shown.alert, outcome, reason);
  _openNext();
  if (answer) {
    _complained = false;
    shown.handlers.onAnswer(*answer);
  } else {
    _complain(reason);
    shown.handlers.onDeclined();
  }
}

void DialogScreen::withdraw(const std::string& id) {
  std::erase_if(_waiting, [&](const Turn& turn) { return turn.id == id; });
  const auto gone = _shown.extract(id);
  if (gone.empty()) return;
  gone.mapped().process->end();
  _openNext();
}

void DialogScreen::agentEnds() {
  _waiting.clear();
  for (const auto& [id, shown] : _shown) shown.process->end();
  _shown.clear();
}

void DialogScreen::_complain(const std::string& reason) {
  if (std::exchange(_complained, true)) return;
  _log.warning("No dialog can be shown: " + reason + "; alerts wait in the runtime directory");
}

}  // namespace zal
