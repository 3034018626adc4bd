#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

constexpr const char* kSata = "/SPSerialATADataType/_items/item0/_items/";

std::string buildStorage(const TagTree& raw) {
  TagTree snapshot(true, "Snapshot");
  buildStorageSection(snapshot, raw);
  return treeText(snapshot.top().findChild("Storage"));
}

TEST(StorageSectionTest, SataDisksAndDrivesWithVolumes) {
  TagTree raw(true, "Macintosh");
  std::string disk = std::string(kSata) + "item0/";
  raw.setValue(disk + "device_model", TagValue("WDC WD5000AAKS"));
  raw.setValue(disk + "device_serial", TagValue("WD-WCAPW1"));
  raw.setValue(disk + "device_revision", TagValue("01.03B01"));
  raw.setValue(disk + "smart_status", TagValue("Verified"));
  raw.setValue(disk + "size", TagValue("500,11 GB"));
  raw.setValue(disk + "size_in_bytes", TagValue(int64_t{500107862016}));
  std::string hd = disk + "volumes/item0/";
  raw.setValue(hd + "_name", TagValue("Macintosh HD"));
  raw.setValue(hd + "file_system", TagValue("Journaled HFS+"));
  raw.setValue(hd + "iocontent", TagValue("Apple_HFS"));
  raw.setValue(hd + "size", TagValue("250 GB"));
  raw.setValue(hd + "size_in_bytes", TagValue(int64_t{250000000000}));
  raw.setValue(hd + "free_space", TagValue("62,5 GB"));
  raw.setValue(hd + "free_space_in_bytes", TagValue(int64_t{62500000000}));
  raw.setValue(hd + "mount_point", TagValue("/"));
  std::string vault = disk + "volumes/item1/";
  raw.setValue(vault + "_name", TagValue("Vault"));
  raw.setValue(vault + "iocontent", TagValue("Apple_CoreStorage"));
  raw.setValue(vault + "size_in_bytes", TagValue(int64_t{100000000000}));
  raw.setValue(vault + "size", TagValue("100 GB"));
  raw.setValue(vault + "free_space", TagValue("19,1 GB"));
  raw.setValue(vault + "free_space_in_bytes", TagValue(int64_t{19100000000}));
  // Without a name the volume is neither written nor counted.
  raw.setValue(disk + "volumes/item2/bsd_name", TagValue("disk0s3"));
  raw.setValue(std::string(kSata) + "item1/device_model", TagValue("MATSHITA DVD-R"));
  raw.setValue(std::string(kSata) + "item1/smart_status", TagValue("Not Supported"));
  raw.setValue(std::string(kSata) + "item2/device_model", TagValue("PIONEER BD-RW"));
  // A disk that reports nothing but its SMART status.
  raw.setValue(std::string(kSata) + "item3/smart_status", TagValue("Failing"));

  EXPECT_EQ(buildStorage(raw), R"(+Storage=
+Physical-disks=
*HDD:1=
model="WDC WD5000AAKS"
interface="SATA"
mediatype=3
~type=media-type
size=500
~base-value=500107862016
serial="WD-WCAPW1"
fw-rev="01.03B01"
partitions=2
*CD:1=
model="MATSHITA DVD-R"
*CD:2=
model="PIONEER BD-RW"
*HDD:2=
interface="SATA"
mediatype=3
~type=media-type
partitions=0
-
+Logical-disks=
*partition:1="Macintosh HD"
file-sys="Journaled HFS+"
size=250.00
~base-value=250000000000
free=62.50
~base-value=62500000000
mount-point="/"
used%=75
~pos=187.50
~max=250.00
~val-units=GB
*partition:2="Vault"
kind="encrypted"
size=100.00
~base-value=100000000000
free=19.10
~base-value=19100000000
used%=80
~pos=80.90
~max=100.00
~val-units=GB
-
-
)");
}

TEST(StorageSectionTest, CountersRunAcrossDisksAndDataTypes) {
  TagTree raw(true, "Macintosh");
  for (const char* disk : {"item0/", "item1/"}) {
    std::string path = std::string(kSata) + disk;
    raw.setValue(path + "smart_status", TagValue("Verified"));
    raw.setValue(path + "volumes/item0/_name", TagValue("A"));
    raw.setValue(path + "volumes/item1/_name", TagValue("B"));
  }
  raw.setValue(std::string(kSata) + "item2/device_model", TagValue("DVD"));
  std::string scsi = "/SPParallelSCSIDataType/_items/item0/_items/item0/_items/item0/";
  raw.setValue(scsi + "device_model", TagValue("SEAGATE ST336"));
  raw.setValue(scsi + "size", TagValue("36,42 GB"));
  raw.setValue(scsi + "volumes/item0/_name", TagValue("Data"));
  raw.setValue("/SPParallelATADataType/_items/item0/_items/item0/device_model",
               TagValue("HL-DT-ST DVD"));

  EXPECT_EQ(buildStorage(raw), R"(+Storage=
+Physical-disks=
*HDD:1=
interface="SATA"
mediatype=3
~type=media-type
partitions=2
*HDD:2=
interface="SATA"
mediatype=3
~type=media-type
partitions=2
*CD:1=
model="DVD"
*HDD:3=
model="SEAGATE ST336"
interface="SCSI"
mediatype="3"
~type=media-type
size=39
~base-value=39105677230
partitions=1
*CD:2=
model="HL-DT-ST DVD"
-
+Logical-disks=
*partition:1="A"
*partition:2="B"
*partition:3="A"
*partition:4="B"
*partition:5="Data"
-
-
)");
}

// The disk's "size" and its byte count, from the two ways profilers give it.
TEST(StorageSectionTest, DiskSizeFromBytesOrText) {
  struct Case {
    const char* key;
    TagValue value;
    const char* expected;
  };
  const std::vector<Case> cases = {
      {"size_in_bytes", TagValue(int64_t{500107862016}), "size=500\n~base-value=500107862016\n"},
      {"size_in_bytes", TagValue("500107862016"), "size=0\n~base-value=0\n"},
      {"size_in_bytes", TagValue(int64_t{-1}), "size=0\n~base-value=-1\n"},
      {"size", TagValue("465,76 GB"), "size=500\n~base-value=500105991946\n"},
      // 0.40 decimal gigabytes stays 0, 0.41 rounds up to 1.
      {"size", TagValue("390625 KB"), "size=0\n~base-value=400000000\n"},
      {"size", TagValue("400390,625 KB"), "size=1\n~base-value=410000000\n"},
      {"size", TagValue("2 TB"), "size=2148\n~base-value=2147483648000\n"},
      {"size", TagValue("1e300 TB"), "size=0\n~base-value=0\n"},
      {"size", TagValue("nan GB"), "size=0\n~base-value=0\n"},
      {"size", TagValue("?"), "size=0\n~base-value=0\n"},
      {"other", TagValue("500 GB"), ""},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    raw.setValue(std::string(kSata) + "item0/smart_status", TagValue("Verified"));
    raw.setValue(std::string(kSata) + "item0/" + c.key, c.value);
    TagTree snapshot(true, "Snapshot");
    buildStorageSection(snapshot, raw);
    const Tag* disk = snapshot.top().findChild("Storage")->firstChild()->findChild("HDD:1");
    ASSERT_NE(disk, nullptr);
    std::string text = treeText(disk);
    size_t size = text.find("size=");
    EXPECT_EQ(size == std::string::npos ? "" : text.substr(size, text.find("partitions") - size),
              c.expected)
        << c.key << " " << c.value.textForm();
  }
}

TEST(StorageSectionTest, VolumeSpaceAndUsedShare) {
  struct Case {
    const char* name;
    std::vector<std::pair<const char*, TagValue>> keys;
    const char* expected;
  };
  const std::vector<Case> cases = {
      {"text sizes keep their fraction",
       {{"size", TagValue("30 GB")}, {"free_space", TagValue("3,35 GB")}},
       R"(*partition:1="V"
size=32.21
~base-value=32212254720
free=3.60
~base-value=3597035110
used%=88
~pos=28.62
~max=32.21
~val-units=GB
)"},
      {"no free space, no used share",
       {{"size", TagValue("30 GB")}, {"size_in_bytes", TagValue(int64_t{30000000000})}},
       R"(*partition:1="V"
size=30.00
~base-value=30000000000
)"},
      {"free space of a volume without size",
       {{"free_space", TagValue("1 GB")}, {"free_space_in_bytes", TagValue(int64_t{1000000000})}},
       R"(*partition:1="V"
free=1.00
~base-value=1000000000
)"},
      {"full volume",
       {{"size", TagValue("1 GB")},
        {"size_in_bytes", TagValue(int64_t{1000000000})},
        {"free_space", TagValue("Zero KB")},
        {"free_space_in_bytes", TagValue(int64_t{0})}},
       R"(*partition:1="V"
size=1.00
~base-value=1000000000
free=0.00
~base-value=0
used%=100
~pos=1.00
~max=1.00
~val-units=GB
)"},
      {"byte count of the wrong kind falls back to the text",
       {{"size", TagValue("2 MB")},
        {"size_in_bytes", TagValue("2097152")},
        {"free_space", TagValue("1 MB")},
        {"file_system", TagValue(int64_t{7})}},
       R"(*partition:1="V"
file-sys=""
size=0.00
~base-value=2097152
free=0.00
~base-value=1048576
used%=50
~pos=0.00
~max=0.00
~val-units=GB
)"},
      {"not a number",
       {{"size", TagValue("nan GB")}, {"free_space", TagValue("1 GB")}},
       R"(*partition:1="V"
size=nan
~base-value=0
free=1.07
~base-value=1073741824
)"},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    std::string volume = std::string(kSata) + "item0/volumes/item0/";
    raw.setValue(std::string(kSata) + "item0/smart_status", TagValue("Verified"));
    raw.setValue(volume + "_name", TagValue("V"));
    for (const auto& [key, value] : c.keys) raw.setValue(volume + key, value);
    TagTree snapshot(true, "Snapshot");
    buildStorageSection(snapshot, raw);
    EXPECT_EQ(
        treeText(snapshot.top().findChild("Storage")->findChild("Logical-disks")->firstChild()),
        c.expected)
        << c.name;
  }
}

TEST(StorageSectionTest, NothingToReportLeavesNoSection) {
  TagTree raw(true, "Macintosh");
  EXPECT_EQ(buildStorage(raw), "");
  // Controllers without devices, and a data type without items.
  raw.top().addChild("SPSerialATADataType").addChild("_items").addChild("item0").addChild("_items");
  raw.setValue("/SPParallelSCSIDataType/_name", TagValue("x"));
  raw.setValue("/SPParallelATADataType/_items/item0/_name", TagValue("bus"));
  EXPECT_EQ(buildStorage(raw), "");
}

}  // namespace
}  // namespace cvn
