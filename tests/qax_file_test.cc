#include "zxml/QAXfile.h"

#include <gtest/gtest.h>
#include <stdlib.h>
#include <time.h>

#include <string>
#include <vector>

#include "qax_reader.h"
#include "zxml/date_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

// Files in both byte orders: directory, trailer, and trees that come back
// from the file image with the same names, kinds, value texts and order.
TEST(SnapshotFileTest, SavedFilesReadBackInBothByteOrders) {
  std::vector<uint8_t> image = SnapshotFile(true).makeImage(false);
  EXPECT_EQ(std::string(image.begin(), image.end()),
            "[H]\ncount=0\nsnapshotcount=0\n" + std::string("\0\0\0\0\0\0\0\0\x03\0QAX!", 14));
  TagTree snapshot(true, "Snapshot");
  snapshot.setValue("/timestamp", TagValue("20141029120000.000000+60"));
  snapshot.setValue("/Memory/size", TagValue(4.0), "base-value", "4294967296");
  snapshot.top().addChild("Disks").setChildValue("disk:1", TagValue("HD")).addAnnotation("k", "");
  for (bool little : {true, false}) {
    TagTree odd(little, "Snapshot");                   // counted as a snapshot by its top name
    odd.setValue("/timestamp", TagValue(int64_t{5}));  // not text: empty timestamp
    odd.setValue("/info", TagValue("line one\nline two"));
    SnapshotFile file(little);
    file.addTree(snapshot, kSnapshotBlock, kWholeText, kCompressed);
    file.addTree(odd, kSnapshotBlock, kSplitSections, kCompressed);
    file.addTree(odd, kAssetInfoBlock, kWholeText, kUncompressed);
    file.addRawData(reinterpret_cast<const uint8_t*>("payload"), 7);
    image = file.makeImage(true);
    QaxFile read;
    std::string error;
    ASSERT_TRUE(parseQaxImage(image.data(), image.size(), &read, &error)) << error;
    std::vector<uint64_t> at = {0};
    for (const auto& b : file.blocks()) at.push_back(at.back() + b->length());
    auto entry = [&](int i, const std::string& rest) {
      return "[" + std::to_string(i) + "]\noffset=" + std::to_string(at[i]) +
             "\nlength=" + std::to_string(at[i + 1] - at[i]) + "\ntype=" + rest + "\n";
    };
    EXPECT_EQ(read.directory,
              "[H]\ncount=4\nsnapshotcount=3\n" +
                  entry(0, "snapshot\ntimestamp=20141029120000.000000+60\nsnaptype=mac:1") +
                  entry(1, "snapshot\ntimestamp=\nsnaptype=mac:1") + entry(2, "assetinfo") +
                  entry(3, "customdata\nID=rawdata"));
    std::string trailer(8, '\0');
    for (int i = 0; i < 2; ++i) trailer[little ? i : 7 - i] = static_cast<char>(at[4] >> (8 * i));
    EXPECT_EQ(std::string(image.end() - 14, image.end()), trailer + "\x03\x01QAX!");
    for (size_t i = 0; i < 3; ++i) {
      const TagTree& original = i == 0 ? snapshot : odd;
      std::string text(original.textSize(), '\0');
      text.resize(original.dumpText(&text[0], 0, kCloseTags, kWithChildren));
      EXPECT_EQ(renderZxmlText(read.blocks[i].tree), text);
    }
    EXPECT_EQ(read.blocks[3].data, "payload");
    ASSERT_EQ(read.warnings.size(), 2u);
    EXPECT_EQ(read.warnings[0],
              "block 1 (snapshot, offset " + std::to_string(at[1]) +
                  ") line 5: no \"=\"; taken as the continuation of the value above");
  }
}

// A split block's directory position is in the file's byte order; 65536
// sections bytes read the other way round would be 256.
TEST(SnapshotFileTest, SplitSectionsAreFoundInTheFilesByteOrder) {
  for (bool little : {true, false}) {
    TagTree tree(little, "Snapshot");
    tree.top().setChildValue("c", TagValue(std::string(65536 - 24, 'v')));
    SnapshotFile file(little);
    file.addTree(tree, kSnapshotBlock, kSplitSections, kUncompressed);
    std::vector<uint8_t> image = file.makeImage(kCompressedDirectory);
    QaxFile read;
    std::string error;
    ASSERT_TRUE(parseQaxImage(image.data(), image.size(), &read, &error)) << error;
    EXPECT_EQ(read.blocks[0].text.size(), 65536u);
  }
}

// 2014-10-29 12:00:00 UTC.
constexpr int64_t kMoment = 1414584000;

TEST(LocalDateTest, ZoneIsWrittenInMinutes) {
  const char* old = getenv("TZ");
  std::string saved = old ? old : "";
  const std::pair<const char*, const char*> zones[] = {
      {"UTC0", "20141029120000.000000+0"},       {"EST5", "20141029070000.000000-300"},
      {"IST-5:30", "20141029173000.000000+330"}, {"NST3:30", "20141029083000.000000-210"},
      {"NPT-5:45", "20141029174500.000000+345"}, {"XXX-14", "20141030020000.000000+840"}};
  for (const auto& zone : zones) {
    setenv("TZ", zone.first, 1);  // no tzset(): the helper must notice anyway
    EXPECT_EQ(formatLocalDate(kMoment, true), zone.second);
  }
  EXPECT_EQ(formatLocalDate(kMoment, false), "2014-10-30");
  EXPECT_EQ(SnapshotFile::makeTimestamp(true).substr(14), ".000000+840");
  old ? setenv("TZ", saved.c_str(), 1) : unsetenv("TZ");
  tzset();
}

}  // namespace
}  // namespace cvn
