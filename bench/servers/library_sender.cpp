#include "bench/servers/library_sender.h"

#include <cstdio>
#include <cstdlib>

#include "bench/servers/record_text.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

constexpr unsigned kRecordsBetweenLooks = 1024;
constexpr std::uint64_t kFullQueue = 3U
                                     << 20U;  // of 4 MiB by default; 1024 records need a quarter of the rest

}  // namespace

LibrarySender::LibrarySender(const std::filesystem::path& socket, unsigned client)
    : _socket(socket.string()), _text(RecordText(client).text()), _position(numberPosition(_text)) {
  lirra_options options;
  lirra_options_init(&options);
  options.socket_path = _socket.c_str();
  options.sender = "callservice";
  _handle = lirra_open(&options);
}

LibrarySender::~LibrarySender() { lirra_close(_handle, 5000); }

void LibrarySender::send(std::uint64_t number) {
  if (++_sinceLook == kRecordsBetweenLooks) {
    _sinceLook = 0;
    lirra_statistics statistics;
    statistics.size = sizeof statistics;
    while (lirra_status(_handle, &statistics) == LIRRA_OK && statistics.queued_bytes > kFullQueue) {
      pauseMicroseconds(200);
    }
  }
  putNumber(_text, _position, number);
  const lirra_result result =
      lirra_log(_handle, kRecordType, "Default", 6, 1'700'000'000'123ULL, _text.c_str());
  if (result != LIRRA_OK) {
    fprintf(stderr, "the client library refused a record: %s\n", lirra_result_text(result));
    exit(1);
  }
}

void LibrarySender::finish() {
  const lirra_result result = lirra_flush(_handle, 30'000);
  if (result != LIRRA_OK) {
    fprintf(stderr, "the client library could not flush: %s\n", lirra_result_text(result));
    exit(1);
  }
}

}  // namespace zal::bench
