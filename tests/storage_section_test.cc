#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "sections/sections.h"
#include "sections/written_volumes.h"
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
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
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
    WrittenVolumes volumes;
    buildStorageSection(snapshot, raw, volumes);
    const Tag* storage = snapshot.top().findChild("Storage");
    const TagProperty* size = storage->firstChild()->firstChild()->findProperty("size");
    const TagProperty* used =
        storage->findChild("Logical-disks")->firstChild()->findProperty("used%");
    std::string text = size ? size->value().textForm() + "/" +
                                  std::string(size->findAnnotation("base-value")->text)
                            : "-";
    EXPECT_EQ(text + " " + (used ? used->value().textForm() : "-"), c.expected) << c.expected;
  }
}

// Today's Macs: the internal disk under NVMe with only APFS container
// partitions, and the mounted volumes listed on their own.
TEST(StorageSectionTest, NvmeDisksAndMountedVolumesEachOnce) {
  TagTree raw(true, "Macintosh");
  // An Intel Mac's second disk: an HFS+ volume the storage type lists again,
  // and an APFS container.
  const std::string sata = std::string(kSata) + "item0/";
  raw.setValue(sata + "device_model", TagValue("Samsung SSD 860"));
  raw.setValue(sata + "smart_status", TagValue("Verified"));
  raw.setValue(sata + "size_in_bytes", TagValue(int64_t{250059350016}));
  raw.setValue(sata + "volumes/item0/_name", TagValue("Archive"));
  raw.setValue(sata + "volumes/item0/bsd_name", TagValue("disk1s2"));
  raw.setValue(sata + "volumes/item0/mount_point", TagValue("/Volumes/Archive"));
  raw.setValue(sata + "volumes/item0/size", TagValue("150 GB"));
  raw.setValue(sata + "volumes/item0/free_space", TagValue("50 GB"));
  raw.setValue(sata + "volumes/item1/_name", TagValue("Container"));
  raw.setValue(sata + "volumes/item1/iocontent", TagValue("Apple_APFS"));
  raw.setValue(sata + "volumes/item1/size", TagValue("100 GB"));
  const std::string nvme = "/SPNVMeDataType/_items/item0/_items/item0/";
  raw.setValue("/SPNVMeDataType/_items/item0/_name", TagValue("Apple SSD Controller"));
  raw.setValue(nvme + "_name", TagValue("APPLE SSD AP1024Z"));
  raw.setValue(nvme + "bsd_name", TagValue("disk0"));
  raw.setValue(nvme + "device_model", TagValue("APPLE SSD AP1024Z"));
  raw.setValue(nvme + "device_revision", TagValue("874.100."));
  raw.setValue(nvme + "device_serial", TagValue("0ba0175a3c2e1f40"));
  raw.setValue(nvme + "size", TagValue("1 TB"));
  raw.setValue(nvme + "size_in_bytes", TagValue(int64_t{1000555581440}));
  raw.setValue(nvme + "smart_status", TagValue("Verified"));
  const char* containers[][3] = {{"iSCPreboot", "Apple_APFS_ISC", "524.3 MB"},
                                 {"Macintosh HD - Data", "Apple_APFS", "994.66 GB"},
                                 {"Recovery", "Apple_APFS_Recovery", "5.37 GB"},
                                 {"EFI", "EFI", "209.7 MB"}};
  for (int i = 0; i < 4; ++i) {
    std::string volume = nvme + "volumes/item" + std::to_string(i) + "/";
    raw.setValue(volume + "_name", TagValue(containers[i][0]));
    raw.setValue(volume + "iocontent", TagValue(containers[i][1]));
    raw.setValue(volume + "size", TagValue(containers[i][2]));
  }
  const struct {
    const char *name, *bsd_name, *file_system, *mount_point;
    int64_t size, free;
    const char* protocol;
  } mounted[] = {
      {"Macintosh HD", "disk3s1s1", "APFS", "/", 994662584320, 512109248512, "Apple Fabric"},
      {"Macintosh HD - Data", "disk3s5", "APFS", "/System/Volumes/Data", 994662584320, 512109248512,
       "Apple Fabric"},
      {"Archive", "disk1s2", "Journaled HFS+", "/Volumes/Archive", 150000000000, 50000000000,
       "SATA"},
      {"AnyDesk", "disk4s1", "HFS+", "/Volumes/AnyDesk", 27774976, 5406720, "Disk Image"},
      {"USB_TM_1TB", "disk6s1", "Case-sensitive APFS", "/Volumes/USB_TM_1TB", 999995129856,
       749995129856, "USB"},
      {"Macintosh HD", "disk3s1s1", "APFS", "/", 994662584320, 512109248512, "Apple Fabric"},
  };
  for (int i = 0; i < 6; ++i) {
    std::string volume = "/SPStorageDataType/_items/item" + std::to_string(i) + "/";
    raw.setValue(volume + "_name", TagValue(mounted[i].name));
    raw.setValue(volume + "bsd_name", TagValue(mounted[i].bsd_name));
    raw.setValue(volume + "file_system", TagValue(mounted[i].file_system));
    raw.setValue(volume + "mount_point", TagValue(mounted[i].mount_point));
    raw.setValue(volume + "size_in_bytes", TagValue(mounted[i].size));
    raw.setValue(volume + "free_space_in_bytes", TagValue(mounted[i].free));
    raw.setValue(volume + "physical_drive/protocol", TagValue(mounted[i].protocol));
  }
  // Not mounted: nothing to record.
  raw.setValue("/SPStorageDataType/_items/item6/_name", TagValue("Update"));
  raw.setValue("/SPStorageDataType/_items/item6/size_in_bytes", TagValue(int64_t{1000}));

  TagTree snapshot(true, "Snapshot");
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  EXPECT_EQ(treeText(snapshot.top().findChild("Storage")), R"(+Storage=
+Physical-disks=
*HDD:1=
model="Samsung SSD 860"
interface="SATA"
mediatype=3
~type=media-type
size=250
~base-value=250059350016
partitions=1
*HDD:2=
model="APPLE SSD AP1024Z"
interface="NVMe"
mediatype=3
~type=media-type
size=1000
~base-value=1000555581440
serial="0ba0175a3c2e1f40"
fw-rev="874.100."
partitions=0
-
+Logical-disks=
*partition:1="Archive"
size=161.06
~base-value=161061273600
free=53.69
~base-value=53687091200
mount-point="/Volumes/Archive"
used%=66
~pos=107.37
~max=161.06
~val-units=GB
*partition:2="Macintosh HD"
file-sys="APFS"
size=994.66
~base-value=994662584320
free=512.11
~base-value=512109248512
mount-point="/"
used%=48
~pos=482.55
~max=994.66
~val-units=GB
*partition:3="Macintosh HD - Data"
file-sys="APFS"
size=994.66
~base-value=994662584320
free=512.11
~base-value=512109248512
mount-point="/System/Volumes/Data"
used%=48
~pos=482.55
~max=994.66
~val-units=GB
*partition:4="USB_TM_1TB"
file-sys="Case-sensitive APFS"
size=1000.00
~base-value=999995129856
free=750.00
~base-value=749995129856
mount-point="/Volumes/USB_TM_1TB"
used%=25
~pos=250.00
~max=1000.00
~val-units=GB
-
-
)");
}

}  // namespace
}  // namespace cvn
