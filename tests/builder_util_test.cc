#include "sections/builder_util.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace cvn {
namespace {

TEST(BuilderUtilTest, SizeInMegabytesAtItsBoundaries) {
  struct Case {
    const char* text;
    int64_t megabytes;
    const char* why;
  };
  const Case cases[] = {
      {"4 GB", 4096, "plain"},
      {"1,5 GB", 1536, "decimal comma"},
      {"1023 KB", 0, "just under a megabyte"},
      {"1024 KB", 1, "one megabyte"},
      {"2 TB", 2048000, "a terabyte counts 1000 gigabytes"},
      {"3.999 GB", 4094, "truncated, not rounded"},
      {"4 gb", 0, "units are case-sensitive"},
      {"", 0, "missing"},
      {"nan GB", 0, "not a number"},
      {"inf GB", 0, "infinite"},
      {"1e300 TB", 0, "beyond float: must not even be narrowed"},
      {"9e15 GB", 0, "beyond int64 as megabytes"},
  };
  for (const Case& c : cases)
    EXPECT_EQ(sizeInMegabytes(c.text), c.megabytes) << c.text << ": " << c.why;
}

TEST(BuilderUtilTest, TruncateToInt64GuardsTheRange) {
  EXPECT_EQ(truncateToInt64(2.99), 2);
  EXPECT_EQ(truncateToInt64(-2.99), -2);
  EXPECT_EQ(truncateToInt64(9223372036854775808.0), 0);
  EXPECT_EQ(truncateToInt64(-9223372036854775808.0), INT64_MIN);
  EXPECT_EQ(truncateToInt64(-9223372036854777856.0), 0);
  EXPECT_EQ(truncateToInt64(9223372036854774784.0), INT64_C(9223372036854774784));
}

TEST(BuilderUtilTest, ItemPositionReadsTheConvertedName) {
  TagTree raw(true, "Macintosh");
  Tag& items = raw.top().addChild("_items");
  EXPECT_EQ(itemPosition(items.addChild("item0"), 5), 0u);
  EXPECT_EQ(itemPosition(items.addChild("item12"), 1), 12u);
  EXPECT_EQ(itemPosition(items.addChild("AC_Power"), 3), 3u);
  EXPECT_EQ(itemPosition(items.addChild("item"), 4), 4u);
  EXPECT_EQ(itemPosition(items.addChild("item1x"), 6), 6u);
  EXPECT_EQ(itemPosition(items.addChild("item99999999999"), 7), 7u);
}

TEST(BuilderUtilTest, ComplexRecordMarksTheParentFirst) {
  TagTree tree(true, "Snapshot");
  addComplexRecord(tree.top(), "mem-slot:1").setProperty("used", TagValue("1"));
  addComplexRecord(tree.top(), "mem-slot:1");
  ASSERT_EQ(tree.top().properties().size(), 1u);
  const TagProperty& marker = *tree.top().properties()[0];
  EXPECT_EQ(marker.value(), TagValue(""));
  ASSERT_EQ(marker.annotations().size(), 1u);
  EXPECT_EQ(marker.annotations()[0], (Annotation{"complex", ""}));
  EXPECT_EQ(tree.top().children().size(), 1u);
}

}  // namespace
}  // namespace cvn
