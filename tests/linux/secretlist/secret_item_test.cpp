#include "platform/linux/secretlist/secret_item.h"

#include <gtest/gtest.h>

#include "tests/support/manual_run_loop.h"

namespace zal::secretlist {
namespace {

SecretItem itemWith(std::map<std::string, std::string> attributes) {
  SecretItem item;
  item.label = "Mail";
  item.attributes = std::move(attributes);
  item.created = WallTime(std::chrono::seconds(1714651387));
  return item;
}

TEST(SecretItemTest, ItemsOfServersAreToldByTheirAttributes) {
  for (const char* name : {"server", "host", "domain", "protocol"})
    EXPECT_TRUE(isInternetItem(itemWith({{name, ""}}))) << name;
  EXPECT_FALSE(isInternetItem(itemWith({})));
  EXPECT_FALSE(isInternetItem(itemWith({{"user", "alice"}, {"xdg:schema", "server"}})));
}

TEST(SecretItemTest, ValuesAreShownOnlyOfAttributesThatSayWhereAndForWhom) {
  const zal::testing::ManualRunLoop clock;
  EXPECT_EQ(
      itemText(itemWith({{"server", "mail.example"}, {"user", "alice"}, {"pin", "1234"}, {"a\nb", "x"}}),
               clock),
      "label: Mail\n"
      "    created: 2024-05-02 14:03:07\n"
      "    locked: no\n"
      "    server: mail.example\n"
      "    user: alice\n"
      "    other attributes: a\\x0ab, pin\n");
}

TEST(SecretItemTest, NothingInAnItemPassesForAnother) {
  const zal::testing::ManualRunLoop clock;
  SecretItem item = itemWith({{"server", "x\nlabel: forged"}});
  item.label = "a\nlabel: b\x1b[2J";
  item.isLocked = true;
  EXPECT_EQ(itemText(item, clock),
            "label: a\\x0alabel: b\\x1b[2J\n"
            "    created: 2024-05-02 14:03:07\n"
            "    locked: yes\n"
            "    server: x\\x0alabel: forged\n");
}

}  // namespace
}  // namespace zal::secretlist
