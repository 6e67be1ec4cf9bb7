#include "cli/dump_run.h"

#include <filesystem>
#include <utility>

#include "cli/delivery.h"
#include "cli/printable_text.h"
#include "platform/json_text.h"
#include "platform/size_text.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr auto kNextLook = 100ms;
/// An agent that does not confirm in this time is at it: a dump may hold it up for a while.
constexpr auto kRequestConfirmation = 2s;
/// What ends a dump without a word mostly ends the agent, which is seen at once; this is for the rest.
constexpr auto kReplyAfterEnd = 5s;

std::string_view lastComponent(std::string_view path) { return path.substr(path.rfind('/') + 1); }

std::string archiveIn(const lirra::Dictionary& reply) {
  const lirra_dictionary* result = nullptr;
  const char* path = nullptr;
  if (lirra_dictionary_dictionary(reply.raw(), "replyResult", &result) != LIRRA_OK ||
      lirra_dictionary_string(result, "logPath", &path) != LIRRA_OK)
    return {};
  return path;
}

std::string missingJson(const std::optional<DumpView>& dump) {
  std::vector<std::string> elements;
  if (dump) {
    for (const DumpView::Missing& one : dump->missing)
      elements.push_back(JsonObject().add("what", one.what).add("why", one.why).text());
  }
  return jsonArray(elements);
}

}  // namespace

bool isDumpOf(const DumpView& record, const std::string& session) {
  // The collection at a session's end has the same service, and a directory that is named by its date.
  return record.service == session &&
         lastComponent(record.directory).starts_with(std::string(lastComponent(session)) + "-Log (");
}

DumpRun::DumpRun(ToolContext& tool, DumpOrder order)
    : _tool(tool),
      _order(std::move(order)),
      _display(tool.out, tool.host.redrawWidth()),
      _start(tool.host.now()),
      _deadline(_start + tool.options.timeout(kUsualLimit)) {}

ExitCode DumpRun::run() {
  if (_tool.socketPath().empty())
    return failToDeliver(_tool, LIRRA_UNREACHABLE, lirra::Client(lirra::Client::Options{}));
  for (const DumpView& earlier : _tool.host.dumps()) _earlierDumps.insert(earlier.name);

  lirra::Client client = openClient(_tool);
  std::uint64_t ticket = 0;
  lirra::Result result = client ? client.ask(_order.session, 14, _order.info, ticket) : LIRRA_UNREACHABLE;
  if (result == LIRRA_OK) result = _reachAgent(client);
  if (result != LIRRA_OK) return failToDeliver(_tool, result, client);

  lirra::Dictionary reply;
  const auto failed = _awaitReply(client, ticket, reply);
  if (!_tool.options.json) _display.close();
  return failed ? *failed : _finish(reply);
}

lirra::Result DumpRun::_reachAgent(lirra::Client& client) {
  for (;;) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(_deadline - _tool.host.now());
    const lirra::Result result = client.flush(
        static_cast<int>(std::min<std::chrono::milliseconds>(left, kRequestConfirmation).count()));
    if (result == LIRRA_TIMEOUT && left > kRequestConfirmation) return LIRRA_OK;
    if (result != LIRRA_UNREACHABLE || !_tool.options.waitForAgent || left <= kNextLook) return result;
    _tool.host.pause(kNextLook);
  }
}

std::optional<ExitCode> DumpRun::_awaitReply(lirra::Client& client, std::uint64_t ticket,
                                             lirra::Dictionary& reply) {
  for (;;) {
    const lirra::Result result = client.awaitReply(ticket, 0, reply);
    _look();
    if (result == LIRRA_OK) return std::nullopt;
    if (result != LIRRA_TIMEOUT) return _failWithoutReply("the agent ended before the dump was done");
    if (const auto trouble = _answerPrompt()) return _failWithoutReply(*trouble);
    const Time now = _tool.host.now();
    if (_cutOff && now - *_cutOff >= kReplyAfterEnd) return _failWithoutReply("the dump was cut off");
    if (now >= _deadline) {
      _display.close();
      return _tool.fail(
          ExitCode::notConfirmed, "the agent has not replied in time",
          "It goes on without this command; a longer --timeout waits longer. It may wait for an "
          "answer: see \"lirractl alerts\".");
    }
    _tool.host.pause(kNextLook);
  }
}

std::optional<std::string> DumpRun::_answerPrompt() {
  if (!_order.description || _promptAnswered) return std::nullopt;
  for (const PostedAlert& alert : _tool.host.alerts()) {
    if (alert.title != _order.promptTitle) continue;
    _promptAnswered = true;
    if (alert.waits()) {
      const auto trouble = _tool.host.answerAlert(alert.id, "default", *_order.description);
      return trouble ? std::optional("the description could not be given: " + *trouble) : std::nullopt;
    }
    // Somebody was faster.
    if (alert.answer != "default")
      return "the dump's prompt was " + (alert.answer.empty() ? alert.state : "cancelled");
  }
  return std::nullopt;
}

void DumpRun::_look() {
  for (DumpView& record : _tool.host.dumps()) {
    const bool isOurs = _dump ? record.name == _dump->name
                              : !_earlierDumps.contains(record.name) && isDumpOf(record, _order.session);
    if (!isOurs) continue;
    _dump = std::move(record);
    break;
  }
  if (_dump && _dump->state == DumpView::State::cutOff && !_cutOff) _cutOff = _tool.host.now();
  if (_tool.options.json) return;
  if (_dump) {
    _display.update(*_dump, _elapsed());
  } else {
    _display.waiting("the agent begins", _elapsed());
  }
}

ExitCode DumpRun::_failWithoutReply(const std::string& trouble) {
  _display.close();
  return _tool.fail(ExitCode::dumpFailed, trouble,
                    _dump ? "What was gathered lies in " + _dump->directory + " or beside it."
                          : "The agent's own log may say more.");
}

ExitCode DumpRun::_finish(const lirra::Dictionary& reply) {
  const std::string archive = archiveIn(reply);
  if (archive.empty()) return _failWithoutReply("the agent made no archive");
  // Another dump for the same service may have been taken for this one while both were made.
  for (DumpView& record : _tool.host.dumps()) {
    if (record.directory + ".zip" == archive) _dump = std::move(record);
  }
  if (_dump && _dump->state == DumpView::State::failed)
    return _failWithoutReply("the dump failed: " + _dump->reason);
  std::error_code error;
  const std::uintmax_t bytes = std::filesystem::file_size(archive, error);
  if (_tool.options.json) {
    JsonObject result;
    result.add("result", "done").add("archive", archive);
    if (!error) result.add("bytes", static_cast<std::uint64_t>(bytes));
    result.add("milliseconds", static_cast<std::int64_t>(_elapsed().count()));
    _tool.out << result.addJson("missing", missingJson(_dump)).text() << "\n";
  } else {
    _tool.out << printableLine(archive) << " (" << (error ? "its size cannot be read" : sizeText(bytes))
              << ")\n";
  }
  return ExitCode::done;
}

std::chrono::milliseconds DumpRun::_elapsed() const {
  return std::chrono::floor<std::chrono::milliseconds>(_tool.host.now() - _start);
}

}  // namespace zal
