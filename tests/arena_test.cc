#include "zxml/arena.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace cvn {
namespace {

TEST(ArenaTest, HandsOutAlignedDisjointRoomThatLivesAsLongAsItsAdopter) {
  Arena kept;
  std::string_view small = kept.copyText("before"), last;
  {
    Arena arena;
    // Enough small pieces to fill several blocks, each aligned.
    for (int i = 0; i < 20000; ++i) {
      auto* number = arena.make<int64_t>(i);
      EXPECT_EQ(reinterpret_cast<uintptr_t>(number) % alignof(int64_t), 0u);
      last = arena.copyText(std::to_string(i));
      EXPECT_EQ(last, std::to_string(i));
      EXPECT_EQ(*number, i);
    }
    kept.adopt(std::move(arena));
    EXPECT_EQ(arena.bytesReserved(), 0u);
  }
  const std::string big(3 << 20, 'x');
  std::string_view copy = kept.copyText(big);
  std::string_view after = kept.copyText("after");
  Arena moved = std::move(kept);
  EXPECT_EQ(last, "19999");
  EXPECT_EQ(copy, big);
  EXPECT_EQ(small, "before");
  // Neither the adopted blocks nor the large piece ended the block being
  // filled: "after" follows "before" with its terminating NUL.
  EXPECT_EQ(after.data(), small.data() + small.size() + 1);
  EXPECT_EQ(after.data()[after.size()], '\0');
  EXPECT_EQ(moved.copyText(""), "");
  EXPECT_GT(moved.bytesReserved(), 3u << 20);
}

// Short texts, the keys and names a document repeats, are stored once; a
// longer one gets a copy of its own each time.
TEST(ArenaTest, SharesTextsUpToSixtyFourBytes) {
  Arena arena;
  SharedTexts shared;
  for (size_t length : {0, 64, 65}) {
    const std::string text(length, 'k');
    const std::string_view first = shared.share(text, arena);
    EXPECT_EQ(shared.share(std::string(text), arena).data() == first.data(), length <= 64)
        << length;
    EXPECT_EQ(first, text);
  }
}

}  // namespace
}  // namespace cvn
