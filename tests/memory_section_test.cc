#include <gtest/gtest.h>

#include <cstdint>
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(MemorySectionTest, SizeInMegabytesAtItsBoundaries) {
  // A decimal comma reads as a point; the result is truncated, not rounded;
  // units are case-sensitive; sizes beyond float (which must not even be
  // narrowed) or beyond int64 as megabytes give 0.
  const struct {
    const char* text;
    int64_t megabytes;
  } cases[] = {{"", 0},        {"nan GB", 0},    {"1024 KB", 1},
               {"1023 KB", 0}, {"1,5 GB", 1536}, {"3.999 GB", 4094},
               {"4 gb", 0},    {"1e300 TB", 0},  {"9e15 GB", 0}};
  for (const auto& c : cases) EXPECT_EQ(sizeInMegabytes(c.text), c.megabytes) << c.text;
}

}  // namespace
}  // namespace cvn
