#include "zxml/tag.h"

#include <gtest/gtest.h>

namespace cvn {
namespace {

TEST(TagTest, PathSetterCreatesBranchesAndEndsInProperty) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/a/b/c", TagValue("x"));
  const Tag* a = tree.top().findChild("a");
  ASSERT_NE(a, nullptr);
  EXPECT_EQ(a->kind(), Tag::Kind::kBranch);
  const Tag* b = a->findChild("b");
  ASSERT_NE(b, nullptr);
  EXPECT_EQ(b->kind(), Tag::Kind::kBranch);
  ASSERT_NE(b->findProperty("c"), nullptr);
  EXPECT_EQ(b->findProperty("c")->value().text(), "x");
}

}  // namespace
}  // namespace cvn
