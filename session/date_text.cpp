#include "session/date_text.h"

namespace zal {

namespace {

constexpr std::size_t kMillisecondsAt = 9;  // after "HH:mm:ss."

void appendPadded(std::string& text, int value, int width) {
  char digits[12];
  int count = 0;
  unsigned rest = value < 0 ? 0U : static_cast<unsigned>(value);
  do {
    digits[count++] = static_cast<char>('0' + rest % 10);
    rest /= 10;
  } while (rest != 0);
  while (count < width) digits[count++] = '0';
  while (count > 0) text.push_back(digits[--count]);
}

void appendDate(std::string& text, const LocalTime& time, char separator) {
  appendPadded(text, time.year, 4);
  text.push_back(separator);
  appendPadded(text, time.month, 2);
  text.push_back(separator);
  appendPadded(text, time.day, 2);
}

void appendTime(std::string& text, const LocalTime& time, char separator) {
  appendPadded(text, time.hour, 2);
  text.push_back(separator);
  appendPadded(text, time.minute, 2);
  text.push_back(separator);
  appendPadded(text, time.second, 2);
}

}  // namespace

std::string sessionDateText(const LocalTime& time) {
  std::string text;
  appendDate(text, time, '-');
  text += " at ";
  appendTime(text, time, '-');
  return text;
}

std::string fileTimeText(const LocalTime& time) {
  std::string text;
  appendTime(text, time, '-');
  return text;
}

std::string entryDateText(const LocalTime& time) {
  std::string text;
  appendTime(text, time, ':');
  text.push_back('.');
  appendPadded(text, time.millisecond, 3);
  text += "  (";
  appendDate(text, time, '-');
  text.push_back(')');
  return text;
}

std::string stampText(const LocalTime& time) {
  std::string text;
  appendDate(text, time, '_');
  text.push_back('_');
  appendTime(text, time, '_');
  return text;
}

void setEntryMilliseconds(std::string& entryDate, int milliseconds) {
  entryDate[kMillisecondsAt] = static_cast<char>('0' + milliseconds / 100);
  entryDate[kMillisecondsAt + 1] = static_cast<char>('0' + milliseconds / 10 % 10);
  entryDate[kMillisecondsAt + 2] = static_cast<char>('0' + milliseconds % 10);
}

}  // namespace zal
