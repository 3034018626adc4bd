#include "zxml/arena.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace cvn {
namespace {

TEST(ArenaTest, HandsOutAlignedDisjointRoomAcrossBlocks) {
  Arena arena;
  std::string expected;
  std::string_view last;
  // Enough small pieces to fill several blocks, mixed with odd sizes.
  for (int i = 0; i < 20000; ++i) {
    auto* number = arena.make<int64_t>(i);
    EXPECT_EQ(reinterpret_cast<uintptr_t>(number) % alignof(int64_t), 0u);
    last = arena.copyText(std::to_string(i));
    EXPECT_EQ(*number, i);
  }
  EXPECT_EQ(last, "19999");
  EXPECT_EQ(last.data()[last.size()], '\0');
}

TEST(ArenaTest, KeepsLargePiecesAndTheBlockBeingFilled) {
  Arena arena;
  std::string_view small = arena.copyText("before");
  std::string big(3 << 20, 'x');
  std::string_view copy = arena.copyText(big);
  std::string_view after = arena.copyText("after");
  EXPECT_EQ(copy, big);
  EXPECT_EQ(small, "before");
  EXPECT_EQ(after, "after");
  // The large piece did not end the small block: "after" follows "before".
  EXPECT_EQ(after.data(), small.data() + small.size() + 1);
  EXPECT_EQ(arena.copyText(""), "");
}

TEST(ArenaTest, AdoptedMemoryLivesAsLongAsTheAdopter) {
  Arena kept;
  std::string_view text;
  {
    Arena other;
    text = other.copyText("moved between trees");
    kept.adopt(std::move(other));
    EXPECT_EQ(other.bytesReserved(), 0u);
  }
  EXPECT_EQ(text, "moved between trees");
  Arena moved = std::move(kept);
  EXPECT_EQ(text, "moved between trees");
  EXPECT_GT(moved.bytesReserved(), 0u);
}

}  // namespace
}  // namespace cvn
