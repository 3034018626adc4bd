#include "zxml/tag.h"

#include <gtest/gtest.h>

#include "tree_text.h"

namespace cvn {
namespace {

TEST(TagTest, PathSettersNotesNoneValuesAndAnnotatePaths) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/a/b/c", TagValue("x"), "unit", "MB");
  tree.setValue("/a/b/c", TagValue(int64_t{7}), "unit", "GB");  // replaces value and note
  tree.setValue("/a/b/c", TagValue());                          // none: no-op
  tree.setValue("/p", TagValue("1"), "key", nullptr);           // a note needs key and text
  tree.top().setChildValue("leaf", TagValue("v")).setValue(TagValue());
  // Annotating by path walks into the first child of each name.
  Tag& x = tree.top().addChild("x");
  x.addChild("p").addChild("y");
  x.addChild("y");
  tree.document().annotateByPath("/x/y", "hit", "1");
  tree.top().annotateByPath("x/y", "hit", "2");
  tree.top().annotateByPath("missing/y", "hit", "3");
  tree.top().annotateByPath("x/none", "hit", "4");
  TagTree copy(tree);
  EXPECT_EQ(treeText(&copy.top()), R"(+Snapshot=
p="1"
+a=
+b=
c=7
~unit=GB
-
-
*leaf="v"
+x=
+p=
*y=
~hit=1
~hit=2
-
*y=
-
-
)");
  EXPECT_TRUE(TagValue(static_cast<const char*>(nullptr)).isText());
}

TEST(TagTest, NumberedNamesFillTheFirstGap) {
  TagTree tree(true, "Disks");
  Tag& tag = tree.top();
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk1");
  tag.addChild("Disk1");
  tag.addChild("Disk3");
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk2");
  // Past the index threshold the lookups still see every child.
  for (int i = 3; i <= 40; ++i) tag.addChild(tag.nextNumberedName("Disk"));
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk41");
  EXPECT_EQ(tag.children().size(), 40u);
}

}  // namespace
}  // namespace cvn
