#include "platform/linux/wifidump/wireless_text.h"

#include <algorithm>
#include <array>
#include <deque>

namespace zal::wifidump {
namespace {

/// In lower case.
constexpr std::array<std::string_view, 19> kWirelessWords = {
    "80211",  "wlan",  "wifi",    "wi-fi",   "wireless", "rfkill", "brcmfmac", "ath6k", "ath9k", "ath10k",
    "ath11k", "wcn36", "iwlwifi", "mwifiex", "mt76",     "rtw8",   "rtl8",     "rtlw",  "cw1200"};

char lowered(char letter) { return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter + 32) : letter; }

std::string_view takeLine(std::string_view& text) {
  const std::string_view line = text.substr(0, text.find('\n'));
  text.remove_prefix(std::min(text.size(), line.size() + 1));
  return line;
}

bool isWireless(std::string_view line, const std::vector<std::string>& interfaces) {
  std::string plain(line);
  std::transform(plain.begin(), plain.end(), plain.begin(), lowered);
  const auto names = [](std::string_view text) {
    return [text](std::string_view word) { return text.find(word) != std::string_view::npos; };
  };
  return std::any_of(kWirelessWords.begin(), kWirelessWords.end(), names(plain)) ||
         std::any_of(interfaces.begin(), interfaces.end(), names(line));
}

}  // namespace

std::vector<std::string> interfacesOf(std::string_view iwDev) {
  constexpr std::string_view kLabel = "Interface ";
  std::vector<std::string> names;
  while (!iwDev.empty()) {
    std::string_view line = takeLine(iwDev);
    line.remove_prefix(std::min(line.size(), line.find_first_not_of(" \t")));
    // A name becomes a part of a file's name.
    if (line.starts_with(kLabel) && line.size() > kLabel.size() && line.find('/') == std::string_view::npos)
      names.emplace_back(line.substr(kLabel.size()));
  }
  return names;
}

std::string wirelessLines(std::string_view kernelLog, const std::vector<std::string>& interfaces,
                          std::size_t mostLines) {
  std::deque<std::string_view> last;
  while (!kernelLog.empty()) {
    const std::string_view line = takeLine(kernelLog);
    if (!isWireless(line, interfaces)) continue;
    last.push_back(line);
    if (last.size() > mostLines) last.pop_front();
  }
  std::string text;
  for (const std::string_view line : last) text += std::string(line) + "\n";
  return text;
}

}  // namespace zal::wifidump
