#include <zlib.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "qax_reader.h"
#include "zxml/tag.h"
#include "zxml/zXML.h"

namespace cvn {
namespace {

const std::string kHeader = "\xEF\xBB\xBF?zxml\n";

std::string dump(const TagTree& tree, bool no_close = false, bool no_children = false) {
  std::string buffer(tree.textSize(), '\0');
  size_t n = tree.dumpText(&buffer[0], 0, no_close, no_children);
  EXPECT_LE(n + 1, buffer.size());
  return buffer.substr(0, n);
}

std::string inflated(const uint8_t* data, size_t size) {
  std::string out, error;
  EXPECT_TRUE(inflateQaxStream(data, size, &out, &error)) << error;
  return out;
}

TagTree makeSampleTree() {
  TagTree tree(true, "Snapshot");
  tree.setValue("/System/model", TagValue("MacBook5,1"));
  tree.setValue("/System/size", TagValue(int64_t{4096}), "unit", "MB");
  return tree;
}

TEST(ZxmlTextTest, SampleTreeDumpsAsEightLines) {
  EXPECT_EQ(dump(makeSampleTree()), kHeader +
                                        "+Snapshot=\n"
                                        "+System=\n"
                                        "model=MacBook5,1\n"
                                        "size=4096\n"
                                        "~unit=MB\n"
                                        "-\n"
                                        "-\n");
}

TEST(ZxmlTextTest, EmptyTreeIsHeaderAndOneLeafLine) {
  TagTree tree(true, "Snapshot");
  EXPECT_EQ(dump(tree), kHeader + "*Snapshot=\n");
  EXPECT_EQ(tree.textSize(), kHeader.size() + 11 + 102);
}

TEST(ZxmlTextTest, ValueTextsAndLineOrder) {
  TagTree tree(true, "AssetInfo");
  Tag& top = tree.top();
  top.addAnnotation("complex", "");
  top.setProperty("yes", TagValue(true));
  top.setProperty("no", TagValue(false));
  top.setProperty("real", TagValue(2.0 / 3.0));
  top.setProperty("half", TagValue(0.125));  // ties round to even, as printf does
  top.setProperty("neg", TagValue(int64_t{-9223372036854775807LL - 1}));
  top.setProperty("none", TagValue());
  top.setProperty("odd", TagValue("a=b~c+d*e-f"), "base-value", "1024");
  Tag& leaf = top.setChildValue("leaf", TagValue(1.0));
  leaf.addAnnotation("split", ",");
  leaf.setProperty("p", TagValue("q"));
  top.addChild("bare");
  EXPECT_EQ(dump(tree), kHeader +
                            "+AssetInfo=\n"
                            "~complex=\n"
                            "yes=true\n"
                            "no=false\n"
                            "real=0.67\n"
                            "half=0.12\n"
                            "neg=-9223372036854775808\n"
                            "none=\n"
                            "odd=a=b~c+d*e-f\n"
                            "~base-value=1024\n"
                            "*leaf=1.00\n"
                            "~split=,\n"
                            "p=q\n"
                            "*bare=\n"
                            "-\n");
}

TEST(ZxmlTextTest, SizeEstimateCoversHugeAndOddNumbers) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/big", TagValue(1.7976931348623157e308));
  tree.setValue("/tiny", TagValue(-1e-300));
  tree.setValue("/nan", TagValue(std::nan("")));
  tree.setValue("/inf", TagValue(-HUGE_VAL));
  std::string text = dump(tree);
  EXPECT_EQ(text.size() + 102, tree.textSize());
  char expected[400];
  std::snprintf(expected, sizeof expected, "big=%.2lf\ntiny=%.2lf\nnan=%.2lf\ninf=%.2lf\n",
                1.7976931348623157e308, -1e-300, std::nan(""), -HUGE_VAL);
  EXPECT_NE(text.find(expected), std::string::npos) << text;
}

TEST(ZxmlTextTest, FlagsApplyToTheTopTagOnly) {
  TagTree tree(true, "Snapshot");
  tree.setValue("/A/B/x", TagValue("1"));
  tree.top().setProperty("p", TagValue("v"));
  EXPECT_EQ(dump(tree, true, true), kHeader + "+Snapshot=\np=v\n");
  EXPECT_EQ(dump(tree, true, false), kHeader + "+Snapshot=\np=v\n+A=\n+B=\nx=1\n-\n-\n");
  EXPECT_EQ(dump(tree, false, true), kHeader + "+Snapshot=\np=v\n-\n");
}

TEST(ZxmlTextTest, DumpWritesAtTheOffset) {
  TagTree tree = makeSampleTree();
  std::string buffer(tree.textSize() + 5, '#');
  size_t n = tree.dumpText(&buffer[0], 5, false, false);
  EXPECT_EQ(buffer.substr(0, 5), "#####");
  EXPECT_EQ(buffer.substr(5, n), dump(tree));
}

TEST(ZxmlBlockTest, CompressedBlockIsStreamAndTrailer) {
  TagTree tree = makeSampleTree();
  std::vector<uint8_t> block = tree.serialise(true, false);
  ASSERT_GE(block.size(), 8u);
  EXPECT_EQ(std::string(block.end() - 6, block.end()), std::string("\x00\x01ZXML", 6));
  EXPECT_EQ(block[0], 0x78);
  EXPECT_EQ(block[1], 0xDA);
  EXPECT_EQ(inflated(block.data(), block.size() - 6), dump(tree));
}

TEST(ZxmlBlockTest, UncompressedBlockIsTextPaddedToTheEstimate) {
  TagTree tree = makeSampleTree();
  std::vector<uint8_t> block = tree.serialise(false, false);
  std::string text = dump(tree);
  ASSERT_EQ(block.size(), tree.textSize());
  EXPECT_EQ(std::string(block.begin(), block.begin() + text.size()), text);
  EXPECT_EQ(std::string(block.begin() + text.size(), block.end()),
            std::string(block.size() - text.size(), '\0'));
}

TEST(ZxmlBlockTest, SplitBlocksHaveSectionsAndDirectory) {
  TagTree tree(false, "Snapshot");
  tree.setValue("/A/x", TagValue("1"));
  tree.setValue("/B/y", TagValue("2"));
  std::string sections = kHeader + "+Snapshot=\n" + "+A=\nx=1\n-\n" + "+B=\ny=2\n-\n";
  size_t root = kHeader.size() + 11;
  std::string directory = "[Root]\noffset=0\nlength=" + std::to_string(root) +
                          "\n[A]\noffset=" + std::to_string(root) + "\nlength=10\n" +
                          "[B]\noffset=" + std::to_string(root + 10) + "\nlength=10\n";
  // Not the native order: the position is stored big-endian on this target.
  std::string position("\0\0\0", 3);
  position += static_cast<char>(sections.size());

  std::vector<uint8_t> plain = tree.serialise(false, true);
  EXPECT_EQ(std::string(plain.begin(), plain.end()),
            sections + directory + position + std::string("\x01\x00", 2));

  std::vector<uint8_t> packed = tree.serialise(true, true);
  ASSERT_GT(packed.size(), 6u);
  EXPECT_EQ(std::string(packed.end() - 6, packed.end()), position + "\x01\x01");
  EXPECT_EQ(inflated(packed.data(), packed.size() - 6), sections + directory);
}

TEST(ZxmlCompressTest, MatchesOneShotLevel9AroundTheChunkSize) {
  for (size_t size :
       {size_t{0}, size_t{1}, size_t{16383}, size_t{16384}, size_t{16385}, size_t{50000}}) {
    std::vector<uint8_t> input(size);
    uint32_t seed = 12345;
    for (uint8_t& b : input) {  // incompressible, so the output outgrows the input
      seed = seed * 1103515245u + 12345u;
      b = static_cast<uint8_t>(seed >> 24);
    }
    std::vector<uint8_t> out = compressLevel9(input.data(), input.size(), kZxmlModule, 6);
    uLongf expected_size = compressBound(size);
    std::vector<uint8_t> expected(expected_size);
    ASSERT_EQ(compress2(expected.data(), &expected_size, input.data(), size, 9), Z_OK);
    expected.resize(expected_size);
    EXPECT_EQ(out, expected) << size;
    EXPECT_GE(out.capacity(), out.size() + 6) << size;
  }
}

TEST(ZxmlCompressTest, EmptyInputGivesTheEmptyStream) {
  std::vector<uint8_t> out = compressLevel9(nullptr, 0, kQaxFileModule);
  EXPECT_EQ(out, (std::vector<uint8_t>{0x78, 0xDA, 0x03, 0x00, 0x00, 0x00, 0x00, 0x01}));
}

TEST(ZxmlCompressDeathTest, AssertionNamesTheModule) {
  EXPECT_DEATH(failAssertion(kQaxFileModule, 77, "ret == Z_STREAM_END"),
               "^zxml/QAXfile:77: failed assertion `ret == Z_STREAM_END'\n");
  EXPECT_DEATH(failAssertion(kTagModule, 5, "strm.avail_in == 0"),
               "^zxml/tag:5: failed assertion `strm.avail_in == 0'\n");
}

// The dump's own number formatting against printf on awkward values.
TEST(ZxmlTextTest, RealTextsMatchPrintf) {
  std::vector<double> values = {0.0,    -0.0,   0.005,    0.015, 0.025,     1.005,  2.675,
                                -0.001, -0.005, 99.995,   0.125, 0.375,     1e15,   8.99e16,
                                9e16,   1e17,   -123.456, 4.0,   2.0 / 3.0, 1e-320, -1e300};
  uint64_t bits = 0x9E3779B97F4A7C15ull;
  for (int i = 0; i < 20000; ++i) {
    bits ^= bits << 13;
    bits ^= bits >> 7;
    bits ^= bits << 17;
    int scale = static_cast<int>(bits % 40) - 20;
    values.push_back(static_cast<double>(static_cast<int64_t>(bits >> 11) % 2000001 - 1000000) /
                     std::pow(10.0, (scale % 6) + 3) * std::pow(10.0, scale / 4));
  }
  for (double v : values) {
    char expected[400];
    std::snprintf(expected, sizeof expected, "%.2lf", v);
    TagValue value(v);
    ASSERT_EQ(value.textForm(), expected) << v;
    ASSERT_EQ(value.textLength(), std::strlen(expected)) << v;
  }
}

}  // namespace
}  // namespace cvn
