// Moves bytes from the clients of a Unix socket into a file: what any logging daemon costs at least.
//
//     undecoded_reader SOCKET FILE

#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <vector>

namespace {

constexpr std::size_t kBlock = 256U << 10U;

int listenAt(const char* path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (strlen(path) >= sizeof address.sun_path) return -1;
  strcpy(address.sun_path, path);
  const int listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (bind(listener, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) return -1;
  return listen(listener, 64) == 0 ? listener : -1;
}

bool writeAll(int file, const char* bytes, std::size_t count) {
  while (count > 0) {
    const ssize_t written = write(file, bytes, count);
    if (written <= 0) return false;
    bytes += written;
    count -= static_cast<std::size_t>(written);
  }
  return true;
}

}  // namespace

int main(int count, char** arguments) {
  if (count != 3) return 2;
  const int listener = listenAt(arguments[1]);
  const int file = open(arguments[2], O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
  if (listener < 0 || file < 0) {
    perror("undecoded_reader");
    return 1;
  }
  std::vector<pollfd> watched{{listener, POLLIN, 0}};
  std::vector<char> block(kBlock);
  while (poll(watched.data(), watched.size(), -1) > 0) {
    if ((watched[0].revents & POLLIN) != 0) {
      watched.push_back({accept4(listener, nullptr, nullptr, SOCK_CLOEXEC), POLLIN, 0});
    }
    for (std::size_t index = watched.size() - 1; index > 0; --index) {
      if (watched[index].revents == 0) continue;
      const ssize_t got = read(watched[index].fd, block.data(), block.size());
      if (got > 0 && writeAll(file, block.data(), static_cast<std::size_t>(got))) continue;
      close(watched[index].fd);
      watched.erase(watched.begin() + static_cast<std::ptrdiff_t>(index));
    }
  }
  return 1;
}
