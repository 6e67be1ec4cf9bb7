// The least that a daemon on the same libraries needs before it listens: an Asio loop, a signal set, a
// spdlog file, a Unix socket. Linked as Debian's packages suggest, dynamically.
//
//     bare_daemon SOCKET FILE

#include <cstdlib>
#include <functional>

#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/spdlog.h>
#include <asio/io_context.hpp>
#include <asio/local/stream_protocol.hpp>
#include <asio/signal_set.hpp>

int main(int count, char** arguments) {
  if (count != 3) return 2;
  const auto logger = spdlog::basic_logger_mt("bare", arguments[2]);
  asio::io_context loop;
  asio::signal_set signals(loop, SIGTERM, SIGINT);
  signals.async_wait([&](const asio::error_code&, int) { loop.stop(); });
  asio::local::stream_protocol::acceptor acceptor(loop, asio::local::stream_protocol::endpoint(arguments[1]));
  std::function<void()> acceptNext = [&] {
    acceptor.async_accept(
        [&](const asio::error_code& error, const asio::local::stream_protocol::socket& peer) {
          if (!error && peer.is_open()) logger->info("a client came");
          acceptNext();
        });
  };
  acceptNext();
  logger->info("listening at {}", arguments[1]);
  loop.run();
  return 0;
}
