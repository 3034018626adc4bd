#include <zlib.h>

#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "zxml/tag.h"
#include "zxml/zXML.h"

namespace cvn {
namespace {

const std::string kHeader = "\xEF\xBB\xBF?zxml\n";

// The dump must fit the size estimate: the block writers allocate by it.
std::string dump(const TagTree& tree) {
  std::string buffer(tree.textSize(), '\0');
  size_t n = tree.dumpText(&buffer[0], 0, false, false);
  EXPECT_LE(n + 1, buffer.size());
  return buffer.substr(0, n);
}

TEST(ZxmlTest, LineKindsValueTextsAndBlocks) {
  EXPECT_EQ(dump(TagTree(true, "Snapshot")), kHeader + "*Snapshot=\n");
  TagTree tree(true, "AssetInfo");
  Tag& top = tree.top();
  top.addAnnotation("complex", "");
  top.setProperty("yes", TagValue(true));
  top.setProperty("no", TagValue(false));
  top.setProperty("neg", TagValue(int64_t{-9223372036854775807LL - 1}));
  top.setProperty("none", TagValue());
  top.setProperty("odd", TagValue("a=b~c+d*e-f"), "base-value", "1024");
  Tag& leaf = top.setChildValue("leaf", TagValue(1.0));
  leaf.addAnnotation("split", ",");
  top.addChild("bare");
  std::string text = kHeader +
                     "+AssetInfo=\n~complex=\nyes=true\nno=false\nneg=-9223372036854775808\nnone=\n"
                     "odd=a=b~c+d*e-f\n~base-value=1024\n*leaf=1.00\n~split=,\n*bare=\n-\n";
  EXPECT_EQ(dump(tree), text);
  std::vector<uint8_t> plain = tree.serialise(false, false);  // padded to the estimate
  EXPECT_EQ(std::string(plain.begin(), plain.end()),
            text + std::string(tree.textSize() - text.size(), '\0'));
  std::vector<uint8_t> packed = tree.serialise(true, false);  // inflated in qax_file_test
  EXPECT_EQ(std::string(packed.end() - 6, packed.end()), std::string("\x00\x01ZXML", 6));
}

// Reals are formatted without printf; they must still match "%.2lf".
TEST(ZxmlTest, RealTextsMatchPrintf) {
  std::vector<double> values = {-0.0,   0.125,  0.005, 0.015,     1.005,   2.675,
                                -0.005, 99.995, 0.375, 1e17,      8.99e16, -123.456,
                                1e-320, -1e300, NAN,   -INFINITY, DBL_MAX};
  for (uint64_t i = 0, bits = 1; i < 20000; ++i, bits = bits * 6364136223846793005ull + 1)
    values.push_back(static_cast<double>(static_cast<int64_t>(bits >> 11) % 2000001 - 1000000) /
                     std::pow(10.0, static_cast<int>(bits % 9)));
  for (double v : values) {
    char expected[400];
    std::snprintf(expected, sizeof expected, "%.2lf", v);
    ASSERT_EQ(TagValue(v).textForm(), expected) << v;
    ASSERT_EQ(TagValue(v).textLength(), std::strlen(expected)) << v;
  }
}

TEST(ZxmlTest, SplitBlockHasSectionsAndDirectory) {
  TagTree split_tree(false, "Snapshot");
  split_tree.setValue("/A/x", TagValue("1"));
  split_tree.setValue("/A/B/y", TagValue("2"));
  std::string sections = kHeader + "+Snapshot=\n+A=\nx=1\n+B=\ny=2\n-\n-\n";
  std::string directory = "[Root]\noffset=0\nlength=20\n[A]\noffset=20\nlength=20\n";
  // Not the native order: the position is stored big-endian on this target.
  std::string position = std::string(3, '\0') + static_cast<char>(sections.size());
  std::vector<uint8_t> split = split_tree.serialise(false, true);
  EXPECT_EQ(std::string(split.begin(), split.end()),
            sections + directory + position + std::string("\x01\x00", 2));
}

TEST(ZxmlTest, MatchesOneShotLevel9AroundTheChunkSize) {
  for (size_t size : {size_t{0}, size_t{16383}, size_t{16384}, size_t{16385}, size_t{50000}}) {
    std::vector<uint8_t> input(size);
    uint32_t seed = 12345;
    // Incompressible, so the output outgrows the input.
    for (uint8_t& b : input) b = static_cast<uint8_t>((seed = seed * 1103515245u + 12345u) >> 24);
    std::vector<uint8_t> out = compressLevel9(input.data(), input.size(), kZxmlModule, 6);
    uLongf expected_size = compressBound(size);
    std::vector<uint8_t> expected(expected_size);
    ASSERT_EQ(compress2(expected.data(), &expected_size, input.data(), size, 9), Z_OK);
    expected.resize(expected_size);
    EXPECT_EQ(out, expected) << size;
  }
}

}  // namespace
}  // namespace cvn
