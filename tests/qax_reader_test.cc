#include "qax_reader.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "qax_json.h"
#include "zxml/zXML.h"

namespace cvn {
namespace {

const std::string kHeader = "\xEF\xBB\xBF?zxml\n";

std::string compressed(const std::string& text) {
  std::vector<uint8_t> out =
      compressLevel9(reinterpret_cast<const uint8_t*>(text.data()), text.size(), kZxmlModule);
  return std::string(out.begin(), out.end());
}

// A file image from ready blocks and a directory: little-endian, directory compressed.
std::string image(const std::string& blocks, const std::string& directory) {
  std::string out = blocks + compressed(directory);
  for (int i = 0; i < 8; ++i) out += static_cast<char>(blocks.size() >> (8 * i));
  return out + "\x03\x01QAX!";
}

std::string entry(size_t offset, size_t length, const char* type = "snapshot") {
  return "[0]\noffset=" + std::to_string(offset) + "\nlength=" + std::to_string(length) +
         "\ntype=" + type + "\n";
}

std::string readError(const std::string& bytes, uint64_t budget = uint64_t{1} << 30) {
  QaxFile file;
  std::string error;
  QaxReadOptions options;
  options.budget = budget;
  options.keep_inflated = false;
  parseQaxImage(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), &file, &error,
                options);
  return error;
}

std::string parseError(const std::string& text) {
  QaxTree tree;
  std::string error;
  return parseZxmlText(text, &tree, nullptr, &error) ? "ok" : error;
}

TEST(QaxReaderTest, DamageIsNamed) {
  std::string block = compressed(kHeader + "+Snapshot=\n-\n") + std::string("\x00\x01ZXML", 6);
  size_t n = block.size();
  std::string head = "[H]\ncount=1\nsnapshotcount=1\n";
  std::string good = image(block, head + entry(0, n));
  std::string bad_format = good, bad_offset = good, flipped = good;
  bad_format[good.size() - 6] = 4;
  bad_offset[good.size() - 14] = 0x7F;
  flipped[5] ^= 0x55;
  std::string deep = kHeader;
  for (int i = 0; i < 300; ++i) deep += "+t=\n";
  // One budget for the whole file: inflated bytes, and what each line of
  // tree text can become.
  std::string wide = compressed(kHeader + "*S=" + std::string(100000, 'v') + "\n") +
                     std::string("\x00\x01ZXML", 6);
  std::string two_wide =
      image(wide + wide, "[H]\ncount=2\nsnapshotcount=2\n" + entry(0, wide.size()) +
                             "[1]\noffset=" + std::to_string(wide.size()) +
                             "\nlength=" + std::to_string(wide.size()) + "\ntype=snapshot\n");
  std::string short_lines = kHeader + "+S=\n";
  for (int i = 0; i < 20000; ++i) short_lines += "a=\n";
  std::string many = compressed(short_lines + "-\n") + std::string("\x00\x01ZXML", 6);
  const std::pair<std::string, std::string> cases[] = {
      {readError("QAX!"), "file of 4 bytes is too short for the 14-byte trailer"},
      {readError(good.substr(0, good.size() - 1)), "no \"QAX!\" magic in the last 4 bytes"},
      {readError(good.substr(3)), "directory at offset " + std::to_string(n) +
                                      ": corrupt zlib stream at byte 2: incorrect header check"},
      {readError(bad_format),
       "format byte at offset " + std::to_string(good.size() - 6) + " is 4, not 3"},
      {readError(bad_offset), "directory offset in the trailer points past the end of the file"},
      {readError(image(block, "[H]\ncount=2\nsnapshotcount=1\n" + entry(0, n))),
       "directory count=2 but it lists 1 blocks"},
      {readError(image(block, head + entry(1, n))),
       "block 0 starts at offset 1 but the block before it ends at 0"},
      {readError(image(block, head + entry(0, n + 1))),
       "block 0 (offset 0, length " + std::to_string(n + 1) + ") runs past the directory at " +
           std::to_string(n)},
      {readError(image(block + block, head + entry(0, n))),
       std::to_string(n) + " bytes between the last block and the directory at " +
           std::to_string(2 * n)},
      {readError(image(block.substr(0, 6) + block.substr(n - 6), head + entry(0, 12))),
       "block 0 (snapshot, offset 0): zlib stream is truncated (ends after 6 bytes)"},
      {readError(image(block + "x", head + entry(0, n + 1))),
       "block 0 (snapshot, offset 0): no \"ZXML\" block trailer"},
      {readError(image(std::string("\x00\x02ZXML", 6), head + entry(0, 6))),
       "block 0 (snapshot, offset 0): unknown block flags 0/2 before \"ZXML\""},
      {readError(flipped).substr(0, 30), "block 0 (snapshot, offset 0): "},
      {readError(two_wide, 150000), "block 1 (snapshot, offset " + std::to_string(wide.size()) +
                                        "): inflated data passes the budget of 150000 bytes for "
                                        "the whole file"},
      {readError(image(many, head + entry(0, many.size())), 1 << 20),
       "block 0 (snapshot, offset 0): inflated data passes the budget of 1 MiB for the whole file"},
      {parseError("+Snapshot=\n-\n"), "line 1: no \"?zxml\" header line with the byte-order mark"},
      {parseError(kHeader), "line 1: no top tag"},
      {parseError(kHeader + "+Snapshot=\n"), "line 2: 1 tags still open at the end"},
      {parseError(kHeader + "+Snapshot=\n-\n-\n"), "line 4: \"-\" closes no open tag"},
      {parseError(kHeader + "+Snapshot=\n-"), "line 3: no line feed at the end of the text"},
      {parseError(kHeader + "junk\n"), "line 2: neither a tag, a property nor an annotation"},
      {parseError(kHeader + "*S=a" + std::string(1, '\0') + "b\n"), "line 2: NUL byte"},
      {parseError(deep), "line 258: tags nested deeper than 256"},
  };
  for (const auto& c : cases) EXPECT_EQ(c.first, c.second);
}

// Continuation lines join the value above, each with a warning, and the text
// renders back as it was. Lines that read one way here but could be markup to
// another reader are named: the inspector's check fails on them.
TEST(QaxReaderTest, ContinuationLinesJoinTheValueAbove) {
  const struct {
    std::string text;
    size_t warnings;
    std::vector<std::string> ambiguities;
  } cases[] = {
      {"+S=first\nsecond\n~note=a\n\nb\n*leaf=\nmore\np=x\ny\n~k=v\n-\n", 5, {}},
      {"+S=v\n-x\n-\n",
       1,
       {"line 3: continuation line begins with \"-\", which a reader could take for markup"}},
      {"+S=v\n+Evil\n~k=a\n*x\n-\n",
       2,
       {"line 3: continuation line begins with \"+\", which a reader could take for markup",
        "line 5: continuation line begins with \"*\", which a reader could take for markup"}},
      {"+S=\np=a\n~x\n-=1\n-\n",
       1,
       {"line 4: continuation line begins with \"~\", which a reader could take for markup",
        "line 5: property name begins with \"-\", which a reader could take for a close"}},
  };
  for (const auto& c : cases) {
    QaxTree tree;
    std::string error;
    std::vector<std::string> warnings, ambiguities;
    ASSERT_TRUE(parseZxmlText(kHeader + c.text, &tree, &warnings, &error, 0, &ambiguities))
        << error;
    EXPECT_EQ(warnings.size(), c.warnings) << c.text;
    EXPECT_EQ(ambiguities, c.ambiguities) << c.text;
    EXPECT_EQ(renderZxmlText(tree), kHeader + c.text);
  }
  QaxTree tree;
  std::string error;
  ASSERT_TRUE(parseZxmlText(kHeader + cases[0].text, &tree, nullptr, &error));
  EXPECT_EQ(tree.top()->value, "first\nsecond");
  EXPECT_EQ(tree.top()->annotations[0].text, "a\n\nb");
}

// Only well-formed UTF-8 passes into the JSON; every other byte becomes the
// character of its code, so any strict decoder reads the output.
TEST(QaxReaderTest, JsonCarriesOnlyWellFormedUtf8) {
  const std::pair<std::string, std::string> cases[] = {
      {"caf\xC3\xA9 \xF0\x9F\x98\x80", "caf\xC3\xA9 \xF0\x9F\x98\x80"},
      {"\xF8\x80\x80", "\\u00f8\\u0080\\u0080"},             // no lead byte past F4
      {"\xC0\xAF", "\\u00c0\\u00af"},                        // overlong
      {"\xED\xA0\x80", "\\u00ed\\u00a0\\u0080"},             // surrogate
      {"\xF4\x90\x80\x80", "\\u00f4\\u0090\\u0080\\u0080"},  // past U+10FFFF
      {"\xE2\x82", "\\u00e2\\u0082"},                        // cut off
  };
  for (const auto& c : cases) {
    QaxFile file;
    file.blocks.emplace_back();
    file.blocks[0].tree.nodes.push_back(QaxNode{"S", false, c.first, {}, {}, {}});
    std::string json = renderQaxJson(file);
    EXPECT_NE(json.find("\"value\": \"" + c.second + "\""), std::string::npos) << c.second;
  }
}

}  // namespace
}  // namespace cvn
