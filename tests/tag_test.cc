#include "zxml/tag.h"

#include <gtest/gtest.h>

#include "tree_text.h"

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

TEST(TagTest, SettingThePathAgainReplacesTheValueAndTheNote) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/a/b/c", TagValue("x"), "unit", "MB");
  tree.setValue("/a/b/c", TagValue(int64_t{7}), "unit", "GB");
  tree.setValue("/a/b/c", TagValue(true), "other", "1");
  tree.setValue("/a/", TagValue("empty name"));
  EXPECT_EQ(treeText(&tree.top()), R"(+Snapshot=
+a=
="empty name"
+b=
c=true
~unit=GB
~other=1
-
-
-
)");
}

TEST(TagTest, NoteNeedsBothKeyAndText) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/p", TagValue("1"), "key", nullptr);
  tree.setValue("/q", TagValue("2"), nullptr, "text");
  tree.top().setProperty("r", TagValue("3"), "key", nullptr);
  tree.setValue("/p", TagValue("4"), "key", nullptr);
  for (const auto& p : tree.top().properties()) EXPECT_TRUE(p->annotations().empty()) << p->name();
}

TEST(TagTest, NoneValueAssignmentIsANoOp) {
  TagValue v("kept");
  v = TagValue();
  EXPECT_EQ(v.text(), "kept");
  TagValue same(int64_t{3});
  const TagValue& alias = same;
  same = alias;
  EXPECT_EQ(same.asInt(), 3);
  v.clear();
  EXPECT_TRUE(v.isNone());
  EXPECT_TRUE(TagValue(static_cast<const char*>(nullptr)).isText());

  TagTree tree(true, "Snapshot");
  tree.setValue("/p", TagValue(2.5));
  tree.setValue("/p", TagValue());
  Tag& child = tree.top().setChildValue("c", TagValue("v"));
  child.setValue(TagValue());
  EXPECT_EQ(treeText(&tree.top()), "+Snapshot=\np=2.50\n*c=\"v\"\n-\n");
}

TEST(TagTest, AnnotateByPathWalksIntoFirstChildren) {
  TagTree tree(true, "Snapshot");
  Tag& x = tree.top().addChild("x");
  x.addChild("p").addChild("y");
  x.addChild("y");
  tree.document().annotateByPath("/x/y", "hit", "1");
  tree.top().annotateByPath("x/y", "hit", "2");
  tree.top().annotateByPath("missing/y", "hit", "3");
  tree.top().annotateByPath("x/none", "hit", "4");
  tree.top().annotateByPath("x", "top-level", "5");
  EXPECT_EQ(treeText(&tree.top()), R"(+Snapshot=
+x=
~top-level=5
+p=
*y=
~hit=1
~hit=2
-
*y=
-
-
)");
}

TEST(TagTest, AnnotatePropertyByPathCreatesNothing) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/a/p", TagValue("1"));
  tree.document().annotatePropertyByPath("/a/p", "k", "v");
  tree.top().annotatePropertyByPath("a/p", "k", "w");
  tree.top().annotatePropertyByPath("a/missing", "k", "x");
  tree.top().annotatePropertyByPath("b/p", "k", "y");
  EXPECT_EQ(treeText(&tree.top()), "+Snapshot=\n+a=\np=\"1\"\n~k=v\n~k=w\n-\n-\n");
}

TEST(TagTest, NumberedNamesFillTheFirstGap) {
  Tag tag(Tag::Kind::kBranch, "Disks");
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk1");
  tag.addChild("Disk1");
  tag.addChild("Disk3");
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk2");
  tag.addChild("Disk2");
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk4");
  // Past the index threshold the lookups still see every child.
  for (int i = 4; i <= 40; ++i) tag.addChild(tag.nextNumberedName("Disk"));
  EXPECT_EQ(tag.nextNumberedName("Disk"), "Disk41");
  EXPECT_EQ(tag.children().size(), 40u);
}

TEST(TagTest, GetOrAddAndDeepCopyKeepOrder) {
  TagTree tree(true, "Snapshot");
  Tag& leaf = tree.top().addChild("leaf");
  EXPECT_EQ(leaf.kind(), Tag::Kind::kLeaf);
  EXPECT_EQ(&tree.top().addChild("leaf"), &leaf);
  leaf.addChild("inner");
  EXPECT_EQ(leaf.kind(), Tag::Kind::kBranch);
  for (int i = 0; i < 20; ++i) tree.setValue("/many/p" + std::to_string(i), TagValue(i));
  tree.setValue("/many/p3", TagValue("again"));
  tree.top().addAnnotation("k", "v");
  tree.top().addAnnotation("k", "v");
  TagTree copy(tree);
  EXPECT_EQ(treeText(&copy.document()), treeText(&tree.document()));
  EXPECT_EQ(copy.top().findChild("many")->properties().size(), 20u);
  EXPECT_EQ(copy.top().findChild("many")->findProperty("p3")->value().text(), "again");
}

}  // namespace
}  // namespace cvn
