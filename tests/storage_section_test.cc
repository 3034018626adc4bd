#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

constexpr const char* kSata = "/SPSerialATADataType/_items/item0/_items/";

TEST(StorageSectionTest, DisksDrivesAndVolumesOfAllBuses) {
  TagTree raw(true, "Macintosh");
  const std::string disk = std::string(kSata) + "item0/";
  raw.setValue(disk + "smart_status", TagValue("Verified"));
  raw.setValue(disk + "size_in_bytes", TagValue(int64_t{500107862016}));
  raw.setValue(disk + "volumes/item0/_name", TagValue("Macintosh HD"));
  raw.setValue(disk + "volumes/item0/size", TagValue("100 GB"));
  raw.setValue(disk + "volumes/item0/free_space", TagValue("11,1 GB"));
  raw.setValue(disk + "volumes/item1/_name", TagValue("Vault"));
  raw.setValue(disk + "volumes/item1/iocontent", TagValue("Apple_CoreStorage"));
  raw.setValue(disk + "volumes/item1/size", TagValue("2 GB"));
  // Without a name the volume is neither written nor counted.
  raw.setValue(disk + "volumes/item2/bsd_name", TagValue("disk0s3"));
  // Optical drives report "Not Supported" or no SMART status at all.
  raw.setValue(std::string(kSata) + "item1/smart_status", TagValue("Not Supported"));
  raw.setValue(std::string(kSata) + "item2/device_model", TagValue("PIONEER BD-RW"));
  const std::string scsi = "/SPParallelSCSIDataType/_items/item0/_items/item0/_items/item0/";
  raw.setValue(scsi + "size", TagValue("36,42 GB"));
  raw.setValue(scsi + "volumes/item0/_name", TagValue("Data"));
  raw.setValue("/SPParallelATADataType/_items/item0/_items/item0/device_model",
               TagValue("HL-DT-ST DVD"));

  TagTree snapshot(true, "Snapshot");
  buildStorageSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Storage")), R"(+Storage=
+Physical-disks=
*HDD:1=
interface="SATA"
mediatype=3
~type=media-type
size=500
~base-value=500107862016
partitions=2
*CD:1=
*CD:2=
model="PIONEER BD-RW"
*HDD:2=
interface="SCSI"
mediatype="3"
~type=media-type
size=39
~base-value=39105677230
partitions=1
*CD:3=
model="HL-DT-ST DVD"
-
+Logical-disks=
*partition:1="Macintosh HD"
size=107.37
~base-value=107374182400
free=11.92
~base-value=11918534246
used%=88
~pos=95.46
~max=107.37
~val-units=GB
*partition:2="Vault"
kind="encrypted"
size=2.15
~base-value=2147483648
*partition:3="Data"
-
-
)");
}

// Disk size "<gigabytes>/<bytes>" and the volume's used share, from odd inputs.
TEST(StorageSectionTest, SizeRoundingAndUsedShare) {
  struct Case {
    const char *disk_key, *disk_size, *volume_size, *volume_free, *expected;
  };
  const std::vector<Case> cases = {
      // 0.40 decimal gigabytes stays 0, 0.41 counts up to 1.
      {"size", "390625 KB", nullptr, nullptr, "0/400000000 -"},
      {"size", "400390,625 KB", nullptr, nullptr, "1/410000000 -"},
      {"size", "1e300 TB", nullptr, nullptr, "0/0 -"},
      {"size_in_bytes", "500107862016", nullptr, nullptr, "0/0 -"},
      {"size", nullptr, "30 GB", "3,35 GB", "- 88"},
      {"size", nullptr, "1 GB", "Zero KB", "- 100"},
      {"size", nullptr, "nan GB", "1 GB", "- -"},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    const std::string disk = std::string(kSata) + "item0/";
    raw.setValue(disk + "smart_status", TagValue("Verified"));
    raw.setValue(disk + "volumes/item0/_name", TagValue("V"));
    if (c.disk_size) raw.setValue(disk + c.disk_key, TagValue(c.disk_size));
    if (c.volume_size) raw.setValue(disk + "volumes/item0/size", TagValue(c.volume_size));
    if (c.volume_free) raw.setValue(disk + "volumes/item0/free_space", TagValue(c.volume_free));
    TagTree snapshot(true, "Snapshot");
    buildStorageSection(snapshot, raw);
    const Tag* storage = snapshot.top().findChild("Storage");
    const TagProperty* size = storage->firstChild()->firstChild()->findProperty("size");
    const TagProperty* used =
        storage->findChild("Logical-disks")->firstChild()->findProperty("used%");
    std::string text =
        size ? size->value().textForm() + "/" + size->findAnnotation("base-value")->text : "-";
    EXPECT_EQ(text + " " + (used ? used->value().textForm() : "-"), c.expected) << c.expected;
  }
}

}  // namespace
}  // namespace cvn
