#include "qax_reader.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "zxml/zXML.h"

namespace cvn {
namespace {

const std::string kHeader = "\xEF\xBB\xBF?zxml\n";

std::string compressed(const std::string& text) {
  std::vector<uint8_t> out =
      compressLevel9(reinterpret_cast<const uint8_t*>(text.data()), text.size(), kZxmlModule);
  return std::string(out.begin(), out.end());
}

std::string treeBlock(const std::string& text) {
  return compressed(text) + std::string("\x00\x01ZXML", 6);
}

// A file image from ready blocks and a directory text.
std::string image(const std::vector<std::string>& blocks, const std::string& directory,
                  bool compress_directory = true) {
  std::string out;
  for (const std::string& b : blocks) out += b;
  uint64_t d = out.size();
  out += compress_directory ? compressed(directory) : directory;
  for (int i = 0; i < 8; ++i) out += static_cast<char>(d >> (8 * i));
  out += compress_directory ? std::string("\x03\x01QAX!", 6) : std::string("\x03\x00QAX!", 6);
  return out;
}

std::string entry(int index, size_t offset, size_t length, const char* type = "snapshot") {
  return "[" + std::to_string(index) + "]\noffset=" + std::to_string(offset) +
         "\nlength=" + std::to_string(length) + "\ntype=" + type + "\n";
}

std::string readError(const std::string& bytes) {
  QaxFile file;
  std::string error;
  bool ok =
      parseQaxImage(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), &file, &error);
  return ok ? "ok" : error;
}

std::string parseError(const std::string& text) {
  QaxTree tree;
  std::string error;
  return parseZxmlText(text, &tree, nullptr, &error) ? "ok" : error;
}

TEST(QaxReaderTest, ValidFileAndItsSingleBlock) {
  std::string block = treeBlock(kHeader + "+Snapshot=\n*a=1\n-\n");
  std::string bytes = image({block}, "[H]\ncount=1\nsnapshotcount=1\n" + entry(0, 0, block.size()));
  EXPECT_EQ(readError(bytes), "ok");
}

TEST(QaxReaderTest, ContainerDamageIsNamed) {
  std::string block = treeBlock(kHeader + "+Snapshot=\n-\n");
  std::string n = std::to_string(block.size());
  std::string head1 = "[H]\ncount=1\nsnapshotcount=1\n";
  std::string good = image({block}, head1 + entry(0, 0, block.size()));
  std::string bad_format = good;
  bad_format[bad_format.size() - 6] = 4;
  std::string bad_offset = good;
  bad_offset[bad_offset.size() - 14] = 0x7F;
  std::string flipped = good;
  flipped[5] ^= 0x55;
  std::string extra = image({block + "x"}, head1 + entry(0, 0, block.size() + 1));
  std::string raw_extra = image(
      {compressed("data") + "zz"},
      "[H]\ncount=1\nsnapshotcount=0\n" + entry(0, 0, compressed("data").size() + 2, "customdata"));
  const std::pair<std::string, std::string> cases[] = {
      {"QAX!", "file of 4 bytes is too short for the 14-byte trailer"},
      {good.substr(0, good.size() - 1), "no \"QAX!\" magic in the last 4 bytes"},
      {good.substr(3), "directory at offset " + std::to_string(block.size()) +
                           ": corrupt zlib stream at byte 2: incorrect header check"},
      {bad_format, "format byte at offset " + std::to_string(good.size() - 6) + " is 4, not 3"},
      {bad_offset, "directory offset in the trailer points past the end of the file"},
      {image({block}, "[H]\ncount=2\nsnapshotcount=1\n" + entry(0, 0, block.size())),
       "directory count=2 but it lists 1 blocks"},
      {image({block}, head1 + entry(0, 1, block.size())),
       "block 0 starts at offset 1 but the block before it ends at 0"},
      {image({block}, head1 + entry(0, 0, block.size() + 1)),
       "block 0 (offset 0, length " + std::to_string(block.size() + 1) +
           ") runs past the directory at " + n},
      {image({block, block}, head1 + entry(0, 0, block.size())),
       n + " bytes between the last block and the directory at " +
           std::to_string(2 * block.size())},
      {image({block}, head1 + entry(0, 0, block.size(), "movie")),
       "directory section [0]: unknown block type \"movie\""},
      {image({block}, head1 + entry(1, 0, block.size())),
       "directory section [1] where [0] belongs"},
      {image({block}, "[H]\ncount=x\nsnapshotcount=1\n" + entry(0, 0, block.size())),
       "directory section [H]: count \"x\" is not a number"},
      {image({block}, "count=1\n"), "directory line 1: neither a section nor a key"},
      {image({block}, head1 + entry(0, 0, block.size()) + "colour=red\n"),
       "directory section [0]: unexpected key \"colour\""},
      {image({block.substr(0, 6) + block.substr(block.size() - 6)}, head1 + entry(0, 0, 12)),
       "block 0 (snapshot, offset 0): zlib stream is truncated (ends after 6 bytes)"},
      {extra, "block 0 (snapshot, offset 0): no \"ZXML\" block trailer"},
      {raw_extra, "block 0 (customdata, offset 0): 2 bytes follow the end of the zlib stream"},
      {image({std::string("\x00\x02ZXML", 6)}, head1 + entry(0, 0, 6)),
       "block 0 (snapshot, offset 0): unknown block flags 0/2 before \"ZXML\""},
  };
  for (const auto& c : cases) EXPECT_EQ(readError(c.first), c.second);
  EXPECT_NE(readError(flipped).find("block 0 (snapshot, offset 0): "), std::string::npos)
      << readError(flipped);
}

TEST(QaxReaderTest, MalformedTextIsNamedByLine) {
  const std::pair<std::string, std::string> cases[] = {
      {"+Snapshot=\n-\n", "line 1: no \"?zxml\" header line with the byte-order mark"},
      {kHeader, "line 1: no top tag"},
      {kHeader + "+Snapshot=\n", "line 2: 1 tags still open at the end"},
      {kHeader + "+Snapshot=\n-\n-\n", "line 4: \"-\" closes no open tag"},
      {kHeader + "+Snapshot=\n-", "line 3: no line feed at the end of the text"},
      {kHeader + "+S=\n+A=\n-\nx=1\n-\n", "line 5: property outside a tag (after a closing \"-\")"},
      {kHeader + "~k=v\n", "line 2: annotation without a tag or property above it"},
      {kHeader + "junk\n", "line 2: neither a tag, a property nor an annotation"},
      {kHeader + "+S=\n-\nstray\n", "line 4: neither a tag, a property nor an annotation"},
      {kHeader + "*S=a" + std::string(1, '\0') + "b\n", "line 2: NUL byte"},
  };
  for (const auto& c : cases) EXPECT_EQ(parseError(c.first), c.second);
  std::string deep = kHeader;
  for (int i = 0; i < 300; ++i) deep += "+t=\n";
  EXPECT_EQ(parseError(deep), "line 258: tags nested deeper than 256");
}

TEST(QaxReaderTest, ContinuationLinesJoinTheValueAbove) {
  std::string text = kHeader +
                     "+S=first\nsecond\n"
                     "~note=a\n\nb\n"
                     "*leaf=\nmore\n"
                     "p=x\ny\n"
                     "~k=v\n"
                     "-\n";
  QaxTree tree;
  std::vector<std::string> warnings;
  std::string error;
  ASSERT_TRUE(parseZxmlText(text, &tree, &warnings, &error)) << error;
  EXPECT_EQ(warnings.size(), 5u);
  EXPECT_EQ(tree.top()->value, "first\nsecond");
  EXPECT_EQ(tree.top()->annotations[0].text, "a\n\nb");
  const QaxProperty* p = tree.findProperty("leaf", "p");
  ASSERT_NE(p, nullptr);
  EXPECT_EQ(p->value, "x\ny");
  EXPECT_EQ(p->annotations[0].key, "k");
  EXPECT_EQ(tree.findNode("/leaf")->value, "\nmore");
  EXPECT_EQ(renderZxmlText(tree), text);
}

TEST(QaxReaderTest, JsonShowsTreesAndEscapes) {
  std::string block = treeBlock(kHeader + "+AssetInfo=\"q\"\n~k=\x01\xff\nx=\xc3\xa9\n*c=\n-\n");
  std::string raw = compressed("payload");
  std::string bytes = image(
      {block, raw}, "[H]\ncount=2\nsnapshotcount=0\n" + entry(0, 0, block.size(), "assetinfo") +
                        entry(1, block.size(), raw.size(), "customdata") + "ID=rawdata\n");
  QaxFile file;
  std::string error;
  ASSERT_TRUE(
      parseQaxImage(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), &file, &error))
      << error;
  EXPECT_EQ(file.findBlock("customdata")->data, "payload");
  std::string json = renderQaxJson(file);
  EXPECT_NE(json.find(R"("name": "AssetInfo",)"), std::string::npos) << json;
  EXPECT_NE(json.find(R"("value": "\"q\"",)"), std::string::npos) << json;
  EXPECT_NE(json.find(R"("annotations": [{"key": "k", "text": "\u0001\u00ff"}])"),
            std::string::npos)
      << json;
  EXPECT_NE(json.find("{\"name\": \"x\", \"value\": \"\xc3\xa9\", \"annotations\": []}"),
            std::string::npos)
      << json;
  EXPECT_NE(json.find(R"("ID": "rawdata", "inflated_size": 7})"), std::string::npos) << json;
}

}  // namespace
}  // namespace cvn
