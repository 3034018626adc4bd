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
  tree.setValue("/p", TagValue("2"), nullptr, "text");          // whether new or not
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
p="2"
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

// Values move between trees and the stack; each copy must hold its own
// text whatever kind of storage the text came from. Under AddressSanitizer
// a copy that still pointed into a dropped tree or string would fail here.
TEST(TagTest, ValuesOwnTheirTextsWhereverTheyCameFrom) {
  const std::string long_text(40, 'x');
  TagValue copied_out;
  TagValue copied_short;
  {
    TagTree tree(true, "Snapshot");
    tree.top().setProperty("long", TagValue(long_text));
    tree.top().setProperty("short", TagValue("abc"));
    copied_out = tree.top().findProperty("long")->value();
    copied_short = tree.top().findProperty("short")->value();
  }
  EXPECT_EQ(copied_out.text(), long_text);
  EXPECT_EQ(copied_short.text(), "abc");

  std::string source = long_text;
  TagValue view = TagValue::viewOf(source);
  TagValue owned = view;
  source.assign(40, 'y');
  EXPECT_EQ(owned.text(), long_text);

  TagValue self(long_text);
  const TagValue& same = self;
  self = same;
  EXPECT_EQ(self.text(), long_text);
  TagValue moved(std::move(self));
  EXPECT_EQ(moved.text(), long_text);
  // A none value assigned over text changes nothing.
  moved = TagValue();
  EXPECT_EQ(moved.text(), long_text);
}

// Past the index threshold lookups go through the index; it must keep the
// first of equal names, also across the index's growth, as the short
// list's front-to-back search does.
TEST(TagTest, LargeListsKeepTheFirstOfEqualNames) {
  // Three children of one name: appending copies, unlike adding, keeps them.
  TagTree source(true, "Source");
  Tag& model = source.top().addChild("model").addChild("twin");
  for (int i = 0; i < 3; ++i) {
    model.setValue(TagValue(i));
    source.top().appendCopyOf(model);
  }
  TagTree tree(true, "Copy");
  Tag& top = tree.top();
  for (int round = 0; round < 200; ++round)
    top.appendCopyOf(*source.top().children()[1 + round % 3]);
  for (int i = 0; i < 100; ++i)
    top.addChild("child" + std::to_string(i)).setProperty("n", TagValue(i));
  EXPECT_EQ(top.children().size(), 300u);
  EXPECT_EQ(top.findChild("twin"), top.children()[0]);
  EXPECT_EQ(top.findChild("twin")->value()->asInt(), 0);
  EXPECT_EQ(top.findChild("child99"), top.children()[299]);
  EXPECT_EQ(top.findChild("child"), nullptr);
  for (int i = 0; i < 40; ++i) top.setProperty("p" + std::to_string(i % 20), TagValue(i));
  EXPECT_EQ(top.properties().size(), 20u);
  EXPECT_EQ(top.findProperty("p3")->value().asInt(), 23);

  // A deep copy of the whole tree keeps the duplicates and their order.
  TagTree copy(tree);
  EXPECT_EQ(copy.top().children().size(), 300u);
  EXPECT_EQ(copy.top().children()[1]->value()->asInt(), 1);
}

}  // namespace
}  // namespace cvn
