#include "dump/diagnostics.h"

#include "platform/platform.h"

namespace zal {
namespace {

_LirraLogCompressor& sharedCompressorOf(const _LirraLogCompressor::Services& services) {
  _LirraLogCompressor::lendServices(&services);
  return *_LirraLogCompressor::sharedInstance();
}

}  // namespace

Diagnostics::Diagnostics(Platform& platform, Collectors& collectors, const SessionServices& session)
    : _compressorServices{.log = platform.agentLog,
                          .copier = platform.fileCopier,
                          .files = platform.files,
                          .queues = platform.queues},
      compressor(sharedCompressorOf(_compressorServices)),
      disk(platform),
      closing({.platform = platform, .collectors = collectors, .compressor = compressor, .disk = &disk}),
      collection({.platform = platform,
                  .collectors = collectors,
                  .closing = closing,
                  .disk = &disk,
                  .usesQueues = true}),
      logDump({.platform = platform,
               .collectors = collectors,
               .session = session,
               .collection = collection,
               .compressor = compressor}),
      dispatcher({.platform = platform,
                  .collectors = collectors,
                  .session = session,
                  .collection = collection,
                  .compressor = compressor,
                  .logDump = logDump}) {
  closing.finishCutOff();
  disk.lookLater();
}

Diagnostics::~Diagnostics() { _LirraLogCompressor::lendServices(nullptr); }

}  // namespace zal
