#pragma once

#include <filesystem>
#include <string>

#include "bench/servers/log_server.h"
#include "client/lirra.h"

namespace zal::bench {

/// A program that logs through the client library with its defaults. It looks at the queue now and then
/// and gives the library time before anything would have to be dropped.
class LibrarySender final : public RecordSender {
 public:
  LibrarySender(const std::filesystem::path& socket, unsigned client);
  ~LibrarySender() override;
  LibrarySender(const LibrarySender&) = delete;
  LibrarySender& operator=(const LibrarySender&) = delete;
  void send(std::uint64_t number) override;
  void finish() override;

 private:
  std::string _socket;
  lirra_handle* _handle = nullptr;
  std::string _text;
  std::size_t _position;
  unsigned _sinceLook = 0;
};

}  // namespace zal::bench
