#include "dump/dump_reply.h"

namespace zal {

ValueMap dumpReply(const std::optional<std::string>& archive) {
  ValueMap result{{"replyAction", kUserDumpAction}};
  if (archive) result["logPath"] = *archive;
  return {{"action", kUserDumpAction}, {"replyResult", result}};
}

void sendDumpReply(const DumpRequest& request, const std::optional<std::string>& archive) {
  if (!request.replyToken || !request.peer || !request.peer->isConnected()) return;
  request.peer->sendReply(*request.replyToken, dumpReply(archive));
}

}  // namespace zal
