#include "zxml/QAXfile.h"

#include <gtest/gtest.h>
#include <stdlib.h>
#include <time.h>
#include <unistd.h>

#include <cstdio>
#include <string>
#include <vector>

#include "qax_reader.h"
#include "zxml/date_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

std::string inflated(const std::vector<uint8_t>& bytes, size_t begin, size_t end) {
  std::string out, error;
  EXPECT_TRUE(inflateQaxStream(bytes.data() + begin, end - begin, &out, &error)) << error;
  return out;
}

std::string tail(const std::vector<uint8_t>& image, size_t n) {
  return std::string(image.end() - static_cast<long>(n), image.end());
}

QaxFile readImage(const std::vector<uint8_t>& image) {
  QaxFile file;
  std::string error;
  EXPECT_TRUE(parseQaxImage(image.data(), image.size(), &file, &error)) << error;
  return file;
}

TEST(SnapshotFileTest, FileWithoutBlocksIsDirectoryAndTrailer) {
  SnapshotFile file(true);
  std::vector<uint8_t> image = file.makeImage(true);
  ASSERT_GT(image.size(), 14u);
  EXPECT_EQ(inflated(image, 0, image.size() - 14), "[H]\ncount=0\nsnapshotcount=0\n");
  EXPECT_EQ(tail(image, 14), std::string(8, '\0') + "\x03\x01QAX!");
}

TEST(SnapshotFileTest, DirectoryListsBlocksWithFileOffsets) {
  TagTree snapshot(true, "Snapshot");
  snapshot.setValue("/timestamp", TagValue("20141029120000.000000+60"));
  snapshot.setValue("/System/model", TagValue("Mac"));
  TagTree asset(true, "AssetInfo");
  asset.setValue("/control/x", TagValue("1"));
  std::vector<uint8_t> raw(3000, 'r');

  SnapshotFile file(true);
  file.addTree(snapshot, kSnapshotBlock, false, true);
  file.addTree(asset, kAssetInfoBlock, false, true);
  file.addRawData(raw.data(), raw.size());
  EXPECT_TRUE(file.hasRawData());
  std::vector<uint8_t> image = file.makeImage(false);
  uint64_t a = file.blocks()[0]->length(), b = file.blocks()[1]->length(),
           c = file.blocks()[2]->length();
  std::string directory =
      "[H]\ncount=3\nsnapshotcount=1\n"
      "[0]\noffset=0\nlength=" +
      std::to_string(a) +
      "\ntype=snapshot\ntimestamp=20141029120000.000000+60\nsnaptype=mac:1\n"
      "[1]\noffset=" +
      std::to_string(a) + "\nlength=" + std::to_string(b) +
      "\ntype=assetinfo\n"
      "[2]\noffset=" +
      std::to_string(a + b) + "\nlength=" + std::to_string(c) + "\ntype=customdata\nID=rawdata\n";
  uint64_t d = a + b + c;
  ASSERT_EQ(image.size(), d + directory.size() + 14);
  EXPECT_EQ(std::string(image.begin() + static_cast<long>(d), image.end() - 14), directory);
  EXPECT_EQ(image[image.size() - 14], d & 0xFF);
  EXPECT_EQ(tail(image, 6), std::string("\x03\x00QAX!", 6));
  // The raw block is a bare stream, no ZXML trailer.
  EXPECT_EQ(inflated(image, a + b, d), std::string(3000, 'r'));
  EXPECT_EQ(
      std::string(image.begin() + static_cast<long>(a) - 4, image.begin() + static_cast<long>(a)),
      "ZXML");
}

TEST(SnapshotFileTest, BigEndianOffsetAndSnapshotCountByTopName) {
  TagTree first(true, "Snapshot");
  TagTree second(true, "Snapshot");
  second.setValue("/timestamp", TagValue(int64_t{5}));  // not text: empty timestamp
  SnapshotFile file(false);
  file.addTree(first, kSnapshotBlock, false, true);
  file.addTree(second, kAssetInfoBlock, false, true);
  std::vector<uint8_t> image = file.makeImage(true);
  uint64_t d = file.blocks()[0]->length() + file.blocks()[1]->length();
  std::string offset(6, '\0');
  offset += static_cast<char>(d >> 8);
  offset += static_cast<char>(d & 0xFF);
  EXPECT_EQ(tail(image, 14), offset + "\x03\x01QAX!");
  std::string directory = inflated(image, d, image.size() - 14);
  EXPECT_EQ(directory.substr(0, 29), "[H]\ncount=2\nsnapshotcount=2\n[");
  EXPECT_NE(directory.find("\ntimestamp=\nsnaptype=mac:1\n"), std::string::npos);
}

TEST(SnapshotFileTest, SaveWritesTheImageOrFails) {
  TagTree tree(true, "Snapshot");
  SnapshotFile file(true);
  file.addTree(tree, kSnapshotBlock, false, true);
  std::string path = ::testing::TempDir() + "/save_test.qax";
  ASSERT_TRUE(file.save(path, true));
  FILE* f = std::fopen(path.c_str(), "rb");
  ASSERT_NE(f, nullptr);
  std::vector<uint8_t> bytes(4096);
  bytes.resize(std::fread(bytes.data(), 1, bytes.size(), f));
  std::fclose(f);
  EXPECT_EQ(bytes, file.makeImage(true));
  std::remove(path.c_str());
  EXPECT_FALSE(file.save("/nonexistent-dir/x.qax", true));
}

// Trees built through the public operations come back from the file with
// the same names, kinds, value texts and order.
TEST(SnapshotFileTest, TreesRoundTripThroughTheReader) {
  TagTree snapshot(true, "Snapshot");
  snapshot.setValue("/timestamp", TagValue("20141029120000.000000+0"));
  snapshot.setValue("/Hardware/Memory/Memory-slot:1/size", TagValue(4.0), "base-value",
                    "4294967296");
  snapshot.setValue("/Hardware/Memory/Memory-slot:1/ecc", TagValue(false));
  snapshot.setValue("/Hardware/Memory/Memory-slot:1/speed", TagValue(int64_t{1067}));
  Tag& disk = snapshot.top().addChild("Disks").setChildValue("disk:1", TagValue("HD"));
  disk.addAnnotation("complex", "");
  disk.setProperty("name", TagValue("Macintosh HD"), "split", ",");
  snapshot.top().findChild("Disks")->addChild("empty");
  snapshot.top().annotatePropertyByPath("Hardware/Memory/Memory-slot:1/size", "unit", "GB");
  TagTree asset(true, "AssetInfo");
  asset.setValue("/control/info", TagValue("line one\nline two"));

  SnapshotFile file(true);
  file.addTree(snapshot, kSnapshotBlock, false, true);
  file.addTree(asset, kAssetInfoBlock, false, true);
  QaxFile read = readImage(file.makeImage(true));
  ASSERT_EQ(read.blocks.size(), 2u);
  for (size_t i = 0; i < 2; ++i) {
    const TagTree& original = i == 0 ? snapshot : asset;
    std::string text(original.textSize(), '\0');
    text.resize(original.dumpText(&text[0], 0, false, false));
    EXPECT_EQ(read.blocks[i].text, text);
    EXPECT_EQ(renderZxmlText(read.blocks[i].tree), text);
  }
  EXPECT_EQ(read.blocks[0].timestamp, "20141029120000.000000+0");
  EXPECT_EQ(read.blocks[0].snaptype, "mac:1");
  const QaxTree& tree = read.blocks[0].tree;
  const QaxProperty* size = tree.findProperty("/Hardware/Memory/Memory-slot:1", "size");
  ASSERT_NE(size, nullptr);
  EXPECT_EQ(size->value, "4.00");
  ASSERT_EQ(size->annotations.size(), 2u);
  EXPECT_EQ(size->annotations[1].key, "unit");
  EXPECT_TRUE(tree.findNode("Disks")->branch);
  EXPECT_FALSE(tree.findNode("/Disks/empty")->branch);
  EXPECT_EQ(tree.findNode("/Disks/disk:1")->value, "HD");
  // A value with a line break reads back whole, with a warning.
  EXPECT_EQ(read.blocks[1].tree.findProperty("/control", "info")->value, "line one\nline two");
  ASSERT_EQ(read.warnings.size(), 1u);
  EXPECT_EQ(read.warnings[0],
            "block 1 (assetinfo, offset " + std::to_string(read.blocks[1].offset) +
                ") line 5: no \"=\"; taken as the continuation of the value above");
}

class LocalDateTest : public ::testing::TestWithParam<std::pair<const char*, const char*>> {
 protected:
  void SetUp() override {
    const char* old = getenv("TZ");
    had_tz_ = old != nullptr;
    if (old) old_tz_ = old;
  }
  void TearDown() override {
    if (had_tz_) {
      setenv("TZ", old_tz_.c_str(), 1);
    } else {
      unsetenv("TZ");
    }
    tzset();
  }
  bool had_tz_ = false;
  std::string old_tz_;
};

// 2014-10-29 12:00:00 UTC.
constexpr int64_t kMoment = 1414584000;

TEST_P(LocalDateTest, ZoneIsWrittenInMinutes) {
  setenv("TZ", GetParam().first, 1);
  tzset();
  EXPECT_EQ(formatLocalDate(kMoment, true), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(Zones, LocalDateTest,
                         ::testing::Values(std::make_pair("UTC0", "20141029120000.000000+0"),
                                           std::make_pair("MSK-3", "20141029150000.000000+180"),
                                           std::make_pair("EST5", "20141029070000.000000-300"),
                                           std::make_pair("IST-5:30", "20141029173000.000000+330"),
                                           std::make_pair("NST3:30", "20141029083000.000000-210"),
                                           std::make_pair("NPT-5:45", "20141029174500.000000+345"),
                                           std::make_pair("XXX-14", "20141030020000.000000+840")));

TEST_F(LocalDateTest, ShortFormAndZoneChangesWithoutTzset) {
  setenv("TZ", "UTC0", 1);
  tzset();
  EXPECT_EQ(formatLocalDate(kMoment, false), "2014-10-29");
  setenv("TZ", "XXX-14", 1);  // no tzset(): the helper must notice anyway
  EXPECT_EQ(formatLocalDate(kMoment, false), "2014-10-30");
  EXPECT_EQ(SnapshotFile::makeTimestamp(false).size(), 10u);
  std::string now = SnapshotFile::makeTimestamp(true);
  EXPECT_EQ(now.substr(14), ".000000+840");
}

}  // namespace
}  // namespace cvn
