#include "agent/session_recovery.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "agent/session_directory.h"
#include "agent/session_type_key.h"
#include "session/entry_codec.h"
#include "session/entry_time_text.h"
#include "session/vistel_session.h"

namespace zal {
namespace {

/// What a record is, as far as its pieces were understood. Not the entries themselves: there may be more than
/// memory takes, so that the record is read twice.
struct CutOffSession {
  std::optional<std::string> type;
  /// The clock may have been set back in the call: the last entry says when it was, not the latest.
  std::optional<WallTime> lastHeardOf;
  std::uint64_t unreadableBytes = 0;
};

CutOffSession understood(const UnfinishedRecord& record) {
  CutOffSession session;
  const std::uint64_t damaged = record.read([&session](std::string_view piece) {
    const auto entry = decodeEntry(piece);
    if (!entry) {
      session.unreadableBytes += piece.size();
    } else if (entry->kind == SessionEntryKind::opened) {
      session.type = std::string(entry->text.value_or(""));
    } else {
      session.lastHeardOf = entry->at;
    }
  });
  session.unreadableBytes += damaged;
  return session;
}

std::string recoveryNote(const CutOffSession& session, SessionServices& services) {
  EntryTimeText time(services.clock, services.timeZone);
  std::string note = "the agent was cut off after ";
  note += time.text(*session.lastHeardOf);
  if (session.unreadableBytes > 0) {
    note += "; " + std::to_string(session.unreadableBytes) + " bytes of its record could not be read";
  }
  return note;
}

/// Returned: whether the record has served.
bool recover(const UnfinishedRecord& record, Platform& platform, SessionServices& services) {
  const CutOffSession cutOff = understood(record);
  const std::string key = sessionTypeKey(cutOff.type);
  if (!cutOff.lastHeardOf) {
    if (cutOff.unreadableBytes > 0) {
      platform.agentLog.warning("Nothing of a session of type " + key + " could be read from the black box");
    }
    return true;
  }
  const auto session =
      std::make_shared<ZalLoggingAgentVistelSession>(key, sessionDirectory(platform, key), services);
  const std::string note = recoveryNote(cutOff, services);
  session->setRecoveryNote(note);
  record.read([&session](std::string_view piece) {
    const auto entry = decodeEntry(piece);
    if (entry && entry->kind != SessionEntryKind::opened) session->replay(*entry);
  });
  const bool isWritten = session->endReplay(*cutOff.lastHeardOf);
  platform.agentLog.notice("Recovered a session of type " + key + ": " + note);
  return isWritten;
}

}  // namespace

void recoverSessions(Platform& platform, SessionServices& sessionServices) {
  SessionServices services = sessionServices;
  services.sessionRecords = nullptr;
  services.CollectServiceLogs = nullptr;
  // There is nobody yet whom waiting for the disk could keep waiting.
  services.queues = nullptr;
  services.writings = nullptr;
  platform.sessionRecords.recover(
      [&](const UnfinishedRecord& record) { return recover(record, platform, services); });
}

}  // namespace zal
