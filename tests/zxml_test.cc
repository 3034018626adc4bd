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
  size_t n = tree.dumpText(&buffer[0], 0, kCloseTags, kWithChildren);
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
  // Each kind of line escapes its own texts, and the size estimate stays an
  // upper bound however long the texts are.
  Tag& section = top.addChild("Processes");
  Tag& process = section.setChildValue("process:1", TagValue("z\n-\n+Evil=1"));
  process.addAnnotation("no\nte=", "t\n~x");
  process.setProperty("cmd=line", TagValue(std::string("a\0b", 3)), "k", "v\n-");
  section.setChildValue("=eq", TagValue(std::string(kMaxZxmlText + 5, 'n')));
  std::string text =
      kHeader +
      "+AssetInfo=\n~complex=\nyes=true\nno=false\nneg=-9223372036854775808\nnone=\n"
      "odd=a=b~c+d*e-f\n~base-value=1024\n*leaf=1.00\n~split=,\n*bare=\n" +
      "+Processes=\n*process:1=z - +Evil=1\n~no te_=t ~x\ncmd_line=a\n~k=v -\n*_eq=" +
      std::string(kMaxZxmlText, 'n') + "\n-\n-\n";
  EXPECT_EQ(dump(tree), text);
  EXPECT_LT(tree.textSize(), text.size() + 200);
  std::vector<uint8_t> plain = tree.serialise(kUncompressed, kWholeText);  // padded to the estimate
  EXPECT_EQ(std::string(plain.begin(), plain.end()),
            text + std::string(tree.textSize() - text.size(), '\0'));
  std::vector<uint8_t> packed =
      tree.serialise(kCompressed, kWholeText);  // inflated in qax_file_test
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
  std::vector<uint8_t> split = split_tree.serialise(kUncompressed, kSplitSections);
  EXPECT_EQ(std::string(split.begin(), split.end()),
            sections + directory + position + std::string("\x01\x00", 2));
}

// What a reader gets back for a collected text, by where it goes: nothing a
// tool prints may open, close or hide a line of markup.
TEST(ZxmlTest, CollectedTextCannotWriteMarkup) {
  const ZxmlField kName = ZxmlField::kName, kValue = ZxmlField::kValue;
  const std::string almost(kMaxZxmlText - 1, 'a');
  const struct {
    std::string text;
    ZxmlField field;
    std::string stored;
  } cases[] = {
      {"Carol Q. Example\n Administrator", kValue, "Carol Q. Example\n Administrator"},
      {"z\n-\n+Evil=1", kValue, "z - +Evil=1"},
      {"a\n*leaf\n~note\nclean", kValue, "a *leaf ~note\nclean"},
      {"a\nb\nc=d", kValue, "a b c=d"},  // joined, the line of b holds "=" too
      {"a\n\nb\n", kValue, "a\n\nb\n"},
      {"x\n-", kValue, "x -"},
      {"\n-", kValue, " -"},
      {"a=b~c+d*e-f", kValue, "a=b~c+d*e-f"},
      {std::string("Safari\0\n-\n+Evil=1", 18), kValue, "Safari"},
      {std::string("\0tail", 5), kValue, ""},
      {"", kValue, ""},
      {"usr-acc:=eq", kName, "usr-acc:_eq"},
      {"Soft:z\n-\n+Evil=1 1.0", kName, "Soft:z - +Evil_1 1.0"},
      {"Soft:Carol\n plain", kName, "Soft:Carol  plain"},
      {std::string("Soft:a\0b", 8), kName, "Soft:a"},
      {"Soft:+*-~", kName, "Soft:+*-~"},
      {"+Evil", kName, "_Evil"},
      {"-", kName, "_"},
      {"~k\n-", kName, "_k -"},
      {"*x=1", kName, "_x_1"},
      {"=", kName, "_"},
      {std::string("\0", 1), kValue, ""},
      {"-1", kValue, "-1"},
      // Cut at the limit, backing off to the start of a split UTF-8 sequence.
      {almost + "ab", kValue, almost + "a"},
      {almost + "\xC3\xA9", kValue, almost},
      {almost + "\xE2\x80\x99", kName, almost},
      {almost + "a\xE2\x80\x99", kValue, almost + "a"},
  };
  for (const auto& c : cases) {
    std::string shown = c.text.substr(0, 40);
    EXPECT_EQ(zxmlText(c.text, c.field), c.stored) << shown;
  }
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
