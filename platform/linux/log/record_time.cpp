#include "platform/linux/log/record_time.h"

namespace zal {
namespace {

void putDigits(char* last, int count, int number) {
  for (; count > 0; --count, number /= 10) *last-- = static_cast<char>('0' + number % 10);
}

}  // namespace

std::string_view RecordTime::nowText() {
  const SteadyTime roughly = _clock.steadyNowRoughly();
  if (_calls > 0 && roughly == _lookedAt) {
    --_calls;
    return {_text.data(), _text.size()};
  }
  _calls = kCallsBetweenLooks - 1;
  _lookedAt = roughly;
  const WallTime now = _clock.wallNow();
  const auto second = std::chrono::floor<std::chrono::seconds>(now);
  if (second != _second) {
    _second = second;
    _setSecond(now);
  }
  const auto millisecond = std::chrono::duration_cast<std::chrono::milliseconds>(now - second);
  putDigits(&_text[22], 3, static_cast<int>(millisecond.count()));
  return {_text.data(), _text.size()};
}

void RecordTime::_setSecond(WallTime moment) {
  const LocalTime local = _clock.localTime(moment);
  _text.fill('0');
  putDigits(&_text[3], 4, local.year);
  putDigits(&_text[6], 2, local.month);
  putDigits(&_text[9], 2, local.day);
  putDigits(&_text[12], 2, local.hour);
  putDigits(&_text[15], 2, local.minute);
  putDigits(&_text[18], 2, local.second);
  _text[4] = _text[7] = '-';
  _text[10] = ' ';
  _text[13] = _text[16] = ':';
  _text[19] = '.';
}

}  // namespace zal
