#include "bench/archive/log_text.h"

#include <cstdio>

namespace zal::bench {
namespace {

constexpr const char* kPrograms[] = {"kernel",       "systemd",     "NetworkManager", "wpa_supplicant",
                                     "ModemManager", "pipewire",    "bluetoothd",     "dbus-daemon",
                                     "call-ui",      "mediaserver", "locationd",      "updater"};
constexpr const char* kWords[] = {
    "connection", "established", "timeout",     "stream",   "packet",    "received",   "dropped",
    "retry",      "interface",   "state",       "changed",  "from",      "to",         "codec",
    "negotiated", "jitter",      "buffer",      "underrun", "candidate", "pair",       "selected",
    "relay",      "address",     "lease",       "renewed",  "scan",      "complete",   "roaming",
    "signal",     "quality",     "threshold",   "exceeded", "session",   "ended",      "reason",
    "unknown",    "request",     "queued",      "worker",   "finished",  "allocation", "failed",
    "fallback",   "enabled",     "thermal",     "level",    "nominal",   "suspend",    "resume",
    "key",        "exchange",    "certificate", "valid",    "bitrate",   "adapted",    "keyframe"};
constexpr const char* kStates[] = {"idle", "connecting", "active", "holding", "closing"};
// Messages as programs have them: few forms, many values. %d a number, %n a small one, %x an identifier,
// %a an address, %f a measure, %s a state, %w a word, %p a phrase.
constexpr const char* kForms[] = {
    "media stream %n: sent %d packets, lost %n, jitter %n.%n ms, round trip %n ms",
    "interface wlan0: signal -%n dBm, noise -92 dBm, rate %f Mbit/s, channel 36, access point associated",
    "connection %x from %a is now %s (was %s)",
    "candidate pair %a -> %a selected after %n ms, nominated by the controlling side",
    "request %x finished with status 200 in %f ms: %p",
    "job %n on queue com.device.worker.%w took %n ms",
    "%p",
    "%p: %w %w",
    "%p (error %n, domain MediaTransportErrorDomain)",
    "decoder: frame %d, type %w, size %d, quantizer %n, reference frames 2, deadline met",
    "lease of %a renewed for 43200 seconds by the server at 192.168.1.1",
    "-[CallController stateDidChange:] session %x is %s: %p",
    "wake-up by %w, slept %n s",
    "retry %n of 5 for %x: %p",
};
constexpr const char* kLevels[] = {"Default", "Info", "Debug", "Error"};

void number(std::string& text, const char* form, unsigned long long value) {
  char buffer[48];
  text.append(buffer, static_cast<std::size_t>(snprintf(buffer, sizeof buffer, form, value)));
}

void appendAddress(std::string& text, RandomSource& random) {
  // A device talks to a handful of neighbours and to some of the rest of the world.
  if (random.below(4) != 0) {
    number(text, "192.168.1.%llu", random.rather(254) + 1);
    return;
  }
  for (int part = 0; part < 4; ++part) number(text, part == 0 ? "%llu" : ".%llu", random.below(254) + 1);
}

void appendTime(std::string& text, std::uint64_t milliseconds) {
  const std::uint64_t seconds = milliseconds / 1000;
  number(text, "2024-05-%02llu ", 2 + seconds / 86400 % 28);
  number(text, "%02llu:", seconds / 3600 % 24);
  number(text, "%02llu:", seconds / 60 % 60);
  number(text, "%02llu.", seconds % 60);
  number(text, "%03llu", milliseconds % 1000);
}

}  // namespace

LogText::LogText(Kind kind, std::uint64_t seed)
    : _kind(kind), _random(seed), _milliseconds(_random.below(86400000)) {}

void LogText::_appendMessage(std::string& text) {
  for (const char* at = _random.of(kForms); *at != 0; ++at) {
    if (*at == '%') {
      _appendValue(text, *++at);
    } else {
      text += *at;
    }
  }
}

void LogText::_appendValue(std::string& text, char kind) {
  switch (kind) {
    case 'd':
      number(text, "%llu", _random.rather(10000));
      break;
    case 'n':
      number(text, "%llu", _random.rather(100));
      break;
    case 'x':
      number(text, "%016llx", _identifier());
      break;
    case 'a':
      appendAddress(text, _random);
      break;
    case 'f':
      number(text, "%llu", _random.rather(500));
      number(text, ".%03llu", _random.below(1000));
      break;
    case 's':
      text += _random.of(kStates);
      break;
    case 'w':
      text += _random.of(kWords);
      break;
    default:
      // One of some hundred phrases, the same ones again and again.
      RandomSource phrase(_random.rather(300));
      for (std::uint64_t words = 3 + phrase.below(6); words > 0; --words) {
        text += phrase.of(kWords);
        if (words > 1) text += ' ';
      }
  }
}

std::uint64_t LogText::_identifier() {
  // What is going on now is named again and again.
  std::uint64_t& one = _identifiers[_random.below(_identifiers.size())];
  if (_random.below(12) == 0) one = _random.next();
  return one;
}

void LogText::appendLine(std::string& text) {
  _milliseconds += _random.rather(400);
  ++_sequence;
  switch (_kind) {
    case Kind::system:
      appendTime(text, _milliseconds);
      text.append(" device ").append(_random.of(kPrograms));
      number(text, "[%llu]: ", 400 + _random.rather(60));
      _appendMessage(text);
      break;
    case Kind::session:
      appendTime(text, _milliseconds);
      number(text, " <%llu> [", _sequence);
      text.append(_random.of(kLevels)).append("] ");
      _appendMessage(text);
      break;
    case Kind::request:
      number(text, "{\"time\":%llu,", 1714600000000 + _milliseconds);
      number(text, "\"id\":\"%016llx\",\"level\":\"", _identifier());
      text.append(_random.of(kLevels)).append("\",\"message\":\"");
      _appendMessage(text);
      number(text, "\",\"bytes\":%llu}", _random.rather(100000));
      break;
    case Kind::metric:
      number(text, "%llu", _milliseconds / 1000);
      for (std::uint64_t& reading : _readings) {
        // Most readings are what they were.
        if (_random.below(3) == 0) reading += 1 + _random.rather(40);
        number(text, "\t%llu", reading);
      }
      break;
  }
  text += '\n';
}

}  // namespace zal::bench
