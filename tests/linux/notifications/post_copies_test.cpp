#include "platform/linux/notifications/post_copies.h"

#include <gtest/gtest.h>

#include <set>

#include "platform/linux/notifications/notification_file.h"

namespace zal {
namespace {

class PostCopiesTest : public ::testing::Test {
 protected:
  PostCopies copies;
};

TEST_F(PostCopiesTest, TheSecondRoadsArrivalIsTheCopy) {
  EXPECT_FALSE(copies.isCopy("a", PostRoad::bus));
  EXPECT_FALSE(copies.isCopy("b", PostRoad::directory));
  EXPECT_TRUE(copies.isCopy("a", PostRoad::directory));
  EXPECT_TRUE(copies.isCopy("b", PostRoad::bus));
}

TEST_F(PostCopiesTest, PostsWithoutAnIdHaveNoCopies) {
  EXPECT_FALSE(copies.isCopy("", PostRoad::bus));
  EXPECT_FALSE(copies.isCopy("", PostRoad::directory));
}

TEST_F(PostCopiesTest, WhoUsesTheSameIdTwiceOnOneRoadPostedTwice) {
  EXPECT_FALSE(copies.isCopy("a", PostRoad::bus));
  EXPECT_FALSE(copies.isCopy("a", PostRoad::bus));
  EXPECT_TRUE(copies.isCopy("a", PostRoad::directory));
  EXPECT_TRUE(copies.isCopy("a", PostRoad::directory));
  EXPECT_FALSE(copies.isCopy("a", PostRoad::directory));
}

TEST_F(PostCopiesTest, TheLatest256ThatCameAloneAreRemembered) {
  EXPECT_FALSE(copies.isCopy("first", PostRoad::bus));
  EXPECT_FALSE(copies.isCopy("second", PostRoad::bus));
  for (int i = 0; i < 255; ++i) EXPECT_FALSE(copies.isCopy(std::to_string(i), PostRoad::bus));
  EXPECT_TRUE(copies.isCopy("second", PostRoad::directory));
  EXPECT_FALSE(copies.isCopy("first", PostRoad::directory));
}

TEST_F(PostCopiesTest, NewIdsAreValidAndDiffer) {
  std::set<std::string> ids;
  for (int i = 0; i < 100; ++i) {
    const std::string id = newPostId();
    EXPECT_TRUE(isPostId(id)) << id;
    EXPECT_EQ(id.size(), 32U);
    ids.insert(id);
  }
  EXPECT_EQ(ids.size(), 100U);
}

}  // namespace
}  // namespace zal
