#pragma once

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <filesystem>
#include <string>
#include <utility>
#include <vector>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/wire/little_endian.h"

namespace zal::testing {

/// One entry as a journal would take it apart.
using JournalFields = std::vector<std::pair<std::string, std::string>>;

/// Takes entries apart as the journal does, and as it exports them; an empty line ends one. What cannot
/// be is a field named "BROKEN".
inline std::vector<JournalFields> parsedEntries(std::string_view bytes) {
  std::vector<JournalFields> entries(1);
  const auto brokenAt = [&](std::string_view where) {
    entries.back().emplace_back("BROKEN", where);
    return entries;
  };
  while (!bytes.empty()) {
    const std::size_t lineEnd = bytes.find('\n');
    if (lineEnd == std::string_view::npos) return brokenAt(bytes);
    const std::string_view line = bytes.substr(0, lineEnd);
    bytes.remove_prefix(lineEnd + 1);
    if (line.empty()) {
      entries.emplace_back();
      continue;
    }
    if (const std::size_t sign = line.find('='); sign != std::string_view::npos) {
      entries.back().emplace_back(line.substr(0, sign), line.substr(sign + 1));
      continue;
    }
    if (bytes.size() < 9) return brokenAt(line);
    const std::uint64_t size = loadLittle(bytes.data(), 8);
    if (size > bytes.size() - 9 || bytes[8 + size] != '\n') return brokenAt(line);
    entries.back().emplace_back(line, bytes.substr(8, size));
    bytes.remove_prefix(9 + size);
  }
  if (entries.back().empty()) entries.pop_back();
  return entries;
}

/// The one entry that the bytes have to be.
inline JournalFields parsedEntry(std::string_view bytes) {
  const auto entries = parsedEntries(bytes);
  return entries.size() == 1 ? entries.front() : JournalFields{{"BROKEN", std::to_string(entries.size())}};
}

/// A journal's socket, whose datagrams wait until the test takes them.
class ListeningJournal {
 public:
  explicit ListeningJournal(const std::string& path) : _path(path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, path.c_str(), sizeof address.sun_path - 1);
    ::bind(_socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address);
  }
  /// As a daemon that dies: nobody listens, and the name is left behind.
  void die() { _socket = {}; }
  ~ListeningJournal() {
    die();
    std::filesystem::remove(_path);
  }

  /// All that has come by now.
  std::vector<JournalFields> entries() {
    std::vector<JournalFields> all;
    for (std::string bytes; _take(bytes);) all.push_back(parsedEntry(bytes));
    return all;
  }
  /// The text of each.
  std::vector<std::string> messages() {
    std::vector<std::string> all;
    for (const JournalFields& fields : entries()) {
      for (const auto& [name, value] : fields) {
        if (name == "MESSAGE") all.push_back(value);
      }
    }
    return all;
  }
  /// How many came as sealed memory.
  int sealed = 0;

 private:
  bool _take(std::string& bytes) {
    std::vector<char> buffer(1U << 20U);
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))];
    iovec place{buffer.data(), buffer.size()};
    msghdr header{};
    header.msg_iov = &place;
    header.msg_iovlen = 1;
    header.msg_control = control;
    header.msg_controllen = sizeof control;
    const ssize_t size = ::recvmsg(_socket.get(), &header, MSG_DONTWAIT | MSG_CMSG_CLOEXEC);
    if (size < 0) return false;
    bytes.assign(buffer.data(), static_cast<std::size_t>(size));
    if (const cmsghdr* passed = CMSG_FIRSTHDR(&header)) {
      int number = -1;
      std::memcpy(&number, CMSG_DATA(passed), sizeof number);
      bytes += _contentOf(Descriptor(number));
    }
    return true;
  }
  std::string _contentOf(const Descriptor& memory) {
    constexpr int kAll = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
    if (::fcntl(memory.get(), F_GET_SEALS) != kAll) return "not sealed";
    ++sealed;
    std::string content(static_cast<std::size_t>(::lseek(memory.get(), 0, SEEK_END)), '\0');
    if (::pread(memory.get(), content.data(), content.size(), 0) < 0) return "not readable";
    return content;
  }

  std::string _path;
  Descriptor _socket{::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
};

}  // namespace zal::testing
