#include "bench/archive/dump_directory.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <utility>

#include "bench/archive/log_text.h"
#include "bench/archive/random_source.h"

namespace zal::bench {
namespace {

/// Writes one file piece by piece; ends the process when the disk does not take it.
class OutputFile {
 public:
  explicit OutputFile(const std::filesystem::path& path) {
    std::filesystem::create_directories(path.parent_path());
    _file = fopen(path.c_str(), "wb");
    if (_file == nullptr) _fail();
  }
  ~OutputFile() {
    if (fclose(_file) != 0) _fail();
  }
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;
  void write(const std::string& bytes) {
    if (fwrite(bytes.data(), 1, bytes.size(), _file) != bytes.size()) _fail();
  }

 private:
  [[noreturn]] static void _fail() {
    perror("the directory to archive");
    exit(1);
  }
  FILE* _file;
};

constexpr std::size_t kPiece = 64U << 10U;

/// Pieces of about 64 KiB until the file has its size.
template <typename AppendPiece>
void writeFile(const std::filesystem::path& path, std::uint64_t size, AppendPiece appendPiece) {
  OutputFile file(path);
  std::string piece;
  for (std::uint64_t done = 0; done < size; done += piece.size()) {
    piece.clear();
    while (piece.size() < std::min<std::uint64_t>(kPiece, size - done)) appendPiece(piece);
    piece.resize(std::min<std::uint64_t>(piece.size(), size - done));
    file.write(piece);
  }
}

void writeLog(const std::filesystem::path& path, std::uint64_t size, LogText::Kind kind, std::uint64_t seed) {
  LogText log(kind, seed);
  writeFile(path, size, [&](std::string& piece) { log.appendLine(piece); });
}

/// Compressed data has no pattern left: its beginning, then any bytes.
void writeCompressed(const std::filesystem::path& path, std::uint64_t size, const char* beginning,
                     std::uint64_t seed) {
  RandomSource random(seed);
  bool first = true;
  writeFile(path, size, [&](std::string& piece) {
    if (std::exchange(first, false)) piece += beginning;
    random.append(piece, 4096);
  });
}

/// Records of a capture: a time, two lengths, the headers of a flow, and a payload that is encrypted,
/// text, or silence.
void writeCapture(const std::filesystem::path& path, std::uint64_t size, std::uint64_t seed) {
  RandomSource random(seed);
  LogText text(LogText::Kind::request, seed);
  std::uint64_t microseconds = seed;
  std::uint16_t sequence = 0;
  writeFile(path, size, [&](std::string& piece) {
    const auto little = [&](std::uint64_t value, int bytes) {
      for (; bytes > 0; --bytes, value >>= 8U) piece += static_cast<char>(value);
    };
    microseconds += random.rather(40000);
    std::string payload;
    const std::uint64_t what = random.below(10);
    if (what < 4) random.append(payload, 60 + random.below(160));
    if (what >= 4 && what < 7) text.appendLine(payload);
    if (what >= 7) payload.assign(40 + random.below(120), '\0');
    little(1714600000 + microseconds / 1000000, 4);
    little(microseconds % 1000000, 4);
    little(payload.size() + 54, 4);
    little(payload.size() + 54, 4);
    const std::uint64_t flow = random.rather(30);
    little(0x0000A1B2C3D40000 + flow, 8);
    little(0x4500080045, 6);
    little(payload.size() + 40, 2);
    little(++sequence, 2);
    little(0x1140, 4);
    little(0x0101A8C000 + flow * 7919, 8);
    little(40000 + flow, 2);
    little(3478, 2);
    little(random.next(), 2);
    little(microseconds / 125, 8);
    little(random.next(), 4);
    piece += payload;
  });
}

/// Fixed-length rows of a table: growing keys, small numbers, measures.
void writeTable(const std::filesystem::path& path, std::uint64_t size, std::uint64_t seed) {
  RandomSource random(seed);
  std::uint32_t key = 0;
  writeFile(path, size, [&](std::string& piece) {
    const std::uint32_t row[8] = {++key,
                                  static_cast<std::uint32_t>(random.rather(16)),
                                  static_cast<std::uint32_t>(random.rather(1000)),
                                  0,
                                  1714600000U + key / 8,
                                  static_cast<std::uint32_t>(random.next()),
                                  static_cast<std::uint32_t>(random.rather(65536)),
                                  0xFFFFFFFFU};
    piece.append(reinterpret_cast<const char*>(row), sizeof row);
  });
}

void writePropertyList(const std::filesystem::path& path, std::uint64_t size, std::uint64_t seed) {
  RandomSource random(seed);
  writeFile(path, size, [&](std::string& piece) {
    char text[160];
    snprintf(text, sizeof text,
             "\t<dict>\n\t\t<key>Identifier%llu</key>\n\t\t<integer>%llu</integer>\n\t</dict>\n",
             static_cast<unsigned long long>(random.below(300)),
             static_cast<unsigned long long>(random.next()));
    piece += text;
  });
}

constexpr LogText::Kind kLogKinds[] = {LogText::Kind::session, LogText::Kind::system, LogText::Kind::request,
                                       LogText::Kind::metric};

}  // namespace

DumpDirectory makeDumpDirectory(const std::filesystem::path& directory, std::uint64_t bytes) {
  std::filesystem::create_directories(directory);
  RandomSource random(2024);
  std::uint64_t seed = 1;
  const auto share = [&](unsigned thousandths) { return bytes / 1000 * thousandths; };
  /// Files of a kind until their share is used up, each of up to `largest`, rather of less.
  const auto fill = [&](unsigned thousandths, std::uint64_t largest, auto writeOne) {
    for (std::uint64_t left = share(thousandths); left > 0; ++seed) {
      const std::uint64_t size = std::min(left, largest / 8 + random.below(largest - largest / 8));
      writeOne(size, std::to_string(seed));
      left -= size;
    }
  };
  writeLog(directory / "System" / "system.log", share(100), LogText::Kind::system, 1);
  fill(360, 4U << 20U, [&](std::uint64_t size, const std::string& name) {
    writeLog(directory / "Logs" / ("Set-" + name + ".log"), size, kLogKinds[seed % 4], seed);
  });
  fill(150, 200U << 10U, [&](std::uint64_t size, const std::string& name) {
    writeLog(directory / "Sessions" / std::to_string(seed % 10) / ("Session_" + name + ".txt"), size,
             kLogKinds[seed % 3], seed);
  });
  fill(20, 300U << 10U, [&](std::uint64_t size, const std::string& name) {
    writePropertyList(directory / "State" / (name + ".plist"), size, seed);
  });
  fill(30, 3U << 20U, [&](std::uint64_t size, const std::string& name) {
    writeTable(directory / "Databases" / (name + ".db"), size, seed);
  });
  fill(200, 20U << 20U, [&](std::uint64_t size, const std::string& name) {
    writeCapture(directory / "Captures" / (name + ".pcap"), size, seed);
  });
  fill(90, 2U << 20U, [&](std::uint64_t size, const std::string& name) {
    writeCompressed(directory / "Rotated" / (name + ".log.gz"), size, "\x1F\x8B\x08", seed);
  });
  fill(50, 3U << 20U, [&](std::uint64_t size, const std::string& name) {
    writeCompressed(directory / "Screens" / (name + ".png"), size, "\x89PNG\r\n\x1A\n", seed);
  });
  DumpDirectory made;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(directory)) {
    if (!entry.is_regular_file()) continue;
    ++made.files;
    made.bytes += entry.file_size();
  }
  return made;
}

}  // namespace zal::bench
