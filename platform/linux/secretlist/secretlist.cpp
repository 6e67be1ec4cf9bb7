#include "platform/linux/secretlist/secretlist.h"

#include <iostream>
#include <variant>

#include "platform/linux/files/escaped_text.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/secretlist/secret_service.h"
#include "platform/linux/secretlist/time_limit.h"

namespace zal::secretlist {
namespace {

constexpr int kDone = 0;
constexpr int kNoService = 1;
constexpr int kWrongUsage = 2;
/// The handshake with a bus knows no limit of its own.
constexpr std::chrono::seconds kConnectLimit{2};
/// For all items together.
constexpr std::chrono::seconds kWholeLimit{10};

constexpr const char* kHelp =
    R"(Lists what the session's secret service holds, without any secret.

Usage: secretlist inet|keys

  inet    items of accounts at servers: those that name a server, host, domain or protocol
  keys    all others

Exit codes: 0 done, 1 no secret service answers, 2 wrong usage.
)";

int fail(int code, const std::string& trouble) {
  std::cerr << "secretlist: " << escapedLine(trouble) << "\n";
  return code;
}

int list(bool internet) {
  limitTime(kConnectLimit);
  auto connected = SecretService::connect();
  if (const auto* trouble = std::get_if<Trouble>(&connected)) return fail(kNoService, trouble->text);
  limitTime(kWholeLimit);
  auto& service = std::get<SecretService>(connected);
  const auto found = service.items();
  if (const auto* trouble = std::get_if<Trouble>(&found)) return fail(kNoService, trouble->text);
  const LinuxClock clock;
  for (const std::string& path : std::get<std::vector<std::string>>(found)) {
    const auto item = service.item(path);
    if (const auto* trouble = std::get_if<Trouble>(&item)) {
      // Which of the two lists it belongs to is not known: it stands in both.
      std::cout << "item " << escapedLine(path) << " cannot be read: " << escapedLine(trouble->text)
                << std::endl;
    } else if (isInternetItem(std::get<SecretItem>(item)) == internet) {
      std::cout << itemText(std::get<SecretItem>(item), clock) << std::flush;
    }
  }
  return std::cout ? kDone : fail(kNoService, "the output cannot be written");
}

}  // namespace

int run(const std::vector<std::string>& words) {
  if (words == std::vector<std::string>{"--help"}) {
    std::cout << kHelp;
    return kDone;
  }
  if (words == std::vector<std::string>{"inet"}) return list(true);
  if (words == std::vector<std::string>{"keys"}) return list(false);
  return fail(kWrongUsage, "one word is needed, inet or keys; see secretlist --help");
}

}  // namespace zal::secretlist
