// Writes small real result files as seeds for the reader's fuzz target when
// CVN_WRITE_FUZZ_SEEDS names a directory; otherwise does nothing.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "zxml/QAXfile.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(FuzzSeedWriter, WritesSeedsOnRequest) {
  const char* dir = std::getenv("CVN_WRITE_FUZZ_SEEDS");
  if (!dir) GTEST_SKIP() << "CVN_WRITE_FUZZ_SEEDS not set";
  TagTree snapshot(true, "Snapshot");
  snapshot.setValue("/timestamp", TagValue("20141029120000.000000+60"));
  snapshot.setValue("/Memory/Memory-slot:1/size", TagValue(4.0), "base-value", "4294967296");
  snapshot.setValue("/Memory/Memory-slot:1/ecc", TagValue(false));
  snapshot.top().addChild("Disks").setChildValue("disk:1", TagValue("HD\nsecond line"));
  TagTree asset(true, "AssetInfo");
  asset.setValue("/control/cpu-count", TagValue(int64_t{2}));

  SnapshotFile scan(true);
  scan.addTree(snapshot, kSnapshotBlock, false, true);
  scan.addTree(asset, kAssetInfoBlock, false, true);
  ASSERT_TRUE(scan.save(std::string(dir) + "/scan.qax", true));

  SnapshotFile debug(false);
  debug.addTree(asset, kAssetInfoBlock, false, true);
  std::string raw = "<?xml version=\"1.0\"?><plist><array/></plist>";
  debug.addRawData(reinterpret_cast<const uint8_t*>(raw.data()), raw.size());
  ASSERT_TRUE(debug.save(std::string(dir) + "/debug_big_endian.qax", true));

  SnapshotFile other(true);
  other.addTree(snapshot, kSnapshotBlock, true, true);
  other.addTree(asset, kAssetInfoBlock, false, false);
  other.addTree(asset, kAssetInfoBlock, true, false);
  ASSERT_TRUE(other.save(std::string(dir) + "/other_modes.qax", false));

  ASSERT_TRUE(SnapshotFile(true).save(std::string(dir) + "/empty.qax", true));
}

}  // namespace
}  // namespace cvn
