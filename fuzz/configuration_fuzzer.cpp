#include <sys/mman.h>

#include <algorithm>
#include <string>

#include <toml++/toml.h>

#include "fuzz/fuzz_entries.h"
#include "fuzz/promise.h"
#include "platform/linux/config/configuration_loader.h"
#include "platform/linux/config/preference_text.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

bool isOneLine(std::string_view text) {
  return std::none_of(text.begin(), text.end(),
                      [](char c) { return (c >= 0 && c < ' ' && c != '\t') || c == '\x7F'; });
}

bool beginsWithLine(std::string_view text) {
  const std::size_t digits = text.find_first_not_of("0123456789");
  return digits != 0 && digits != std::string_view::npos && text.substr(digits, 2) == ": ";
}

void readConfiguration(std::string_view text) {
  const Descriptor file(::memfd_create("fuzzed-configuration", MFD_CLOEXEC));
  if (!file.isOpen() || writeWhole(file.get(), text)) return;
  const std::string path = "/proc/self/fd/" + std::to_string(file.get());
  const LoadedConfiguration loaded =
      ConfigurationLoader(
          {.variables = {{"LIRRA_CONFIG", path}}, .userId = 1000, .homeDirectory = "/home/somebody"})
          .load();
  for (const std::string& warning : loaded.warnings) {
    promise(isOneLine(warning), "a warning is one line that a terminal can show");
    promise(
        warning.starts_with(path + ":") && beginsWithLine(std::string_view(warning).substr(path.size() + 1)),
        "a warning names file and line");
  }
  const Configuration& configuration = loaded.configuration;
  promise(configuration.roots.UserLogRoot.starts_with('/'), "a root is absolute");
  promise(configuration.roots.StateRoot.starts_with('/'), "a root is absolute");
  promise(configuration.ipc.maximumPayload >= 1024 && configuration.ipc.maximumPayload <= 1U << 30U,
          "a number is in its range");
  promise(configuration.log.rotationSize >= 1024 && configuration.log.rotationSize <= 1U << 30U,
          "a number is in its range");
  promise(configuration.log.maximumOpenFiles >= 1, "a number is in its range");
  promise(!configuration.commands.systemLogReader.empty() &&
              configuration.commands.systemLogReader.find('/') == std::string::npos,
          "the log reader is a plain name");
}

std::optional<toml::table> tableOf(const std::string& text) {
  try {
    return toml::parse(text);
  } catch (const toml::parse_error&) {
    return std::nullopt;
  }
}

void setSwitch(const std::string& text) {
  for (const char* key : {"CallLogging", "a", "not a key"}) {
    std::string reason;
    const auto changed = withSwitch(text, key, true, reason);
    if (!changed) {
      promise(beginsWithLine(reason), "a refusal names the line");
      continue;
    }
    auto before = tableOf(text);
    auto after = tableOf(*changed);
    promise(before && after, "what is set in a whole file leaves a whole file");
    promise((*after)[key].value_exact<bool>() == true, "a switch that was set is on");
    before->erase(key);
    after->erase(key);
    promise(*before == *after, "nothing else changes");
  }
}

}  // namespace

void fuzzConfiguration(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return;
  const std::string text(reinterpret_cast<const char*>(data + 1), size - 1);
  if (data[0] == 0) {
    readConfiguration(text);
  } else {
    setSwitch(text);
  }
}

}  // namespace zal

#ifdef ZAL_FUZZER
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  zal::fuzzConfiguration(data, size);
  return 0;
}
#endif
