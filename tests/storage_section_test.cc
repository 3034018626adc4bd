// The disks, drives and volumes of every bus, and the USB devices and
// removable disks, from small raw trees of the odd shapes real profilers
// print; both sample Macs show the ordinary ones.
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

using Keys = std::vector<std::pair<std::string, TagValue>>;

const std::string kSata = "SPSerialATADataType/_items/item0/_items/";
const std::string kNvme = "SPNVMeDataType/_items/item0/_items/item0/";
const std::string kMounted = "SPStorageDataType/_items/";
const std::string kUsb = "SPUSBDataType/_items/item0/_items/";
const std::string kHost = "SPUSBHostDataType/_items/item0/_items/";

/// The snapshot that the storage and then the USB builder write from `keys`.
std::string buildDisks(const Keys& keys, FakeCommandRunner& runner) {
  TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
  for (const auto& [path, value] : keys) raw.setValue("/" + path, value);
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  buildUsbSection(snapshot, raw, runner, volumes);
  return treeText(&snapshot.top());
}

std::string buildDisks(const Keys& keys) {
  FakeCommandRunner runner;
  return buildDisks(keys, runner);
}

// Optical drives (no SMART status, or "Not Supported"), SCSI's media type as
// text, volumes without a name, APFS containers (unmounted and without free
// space: by their content on SATA, always on NVMe), disk images, and mounted
// volumes a disk already gave.
TEST(StorageSectionTest, DrivesContainersAndVolumesThatCountOrNot) {
  const std::string disk = kSata + "item0/volumes/";
  EXPECT_EQ(buildDisks({
                {kSata + "item0/smart_status", "Verified"},
                {disk + "item0/_name", "Macintosh HD"},
                {disk + "item0/bsd_name", "disk0s2"},
                {disk + "item1/_name", "Vault"},
                {disk + "item1/iocontent", "Apple_CoreStorage"},
                {disk + "item2/bsd_name", "disk0s3"},
                {disk + "item3/_name", "Container"},
                {disk + "item3/iocontent", "Apple_APFS"},
                {disk + "item4/_name", "Old"},
                {disk + "item4/iocontent", "Apple_HFS"},
                {kSata + "item1/smart_status", "Not Supported"},
                {kSata + "item2/device_model", "PIONEER BD-RW"},
                {kNvme + "smart_status", "Verified"},
                {kNvme + "volumes/item0/_name", "iSCPreboot"},
                {kNvme + "volumes/item1/_name", "Free"},
                {kNvme + "volumes/item1/free_space", "1 GB"},
                {kNvme + "volumes/item2/_name", "Bytes"},
                {kNvme + "volumes/item2/free_space_in_bytes", int64_t{1000000000}},
                {kNvme + "volumes/item3/_name", "Mounted"},
                {kNvme + "volumes/item3/mount_point", "/Volumes/M"},
                {"SPParallelSCSIDataType/_items/item0/_items/item0/_items/item0/size", "36,42 GB"},
                {"SPParallelATADataType/_items/item0/_items/item0/device_model", "HL-DT-ST DVD"},
                {kMounted + "item0/_name", "Macintosh HD"},
                {kMounted + "item0/bsd_name", "disk0s2"},
                {kMounted + "item0/mount_point", "/"},
                {kMounted + "item1/_name", "Installer"},
                {kMounted + "item1/mount_point", "/Volumes/Installer"},
                {kMounted + "item1/physical_drive/protocol", "Disk Image"},
                {kMounted + "item2/_name", "Update"},
                {kMounted + "item2/size_in_bytes", int64_t{1000}},
                {kMounted + "item3/mount_point", "/Volumes/Nameless"},
                {kMounted + "item4/_name", "Spare"},
                {kMounted + "item4/free_space_in_bytes", int64_t{5000000000}},
                {kMounted + "item5/_name", "Mounted again"},
                {kMounted + "item5/mount_point", "/Volumes/M"},
            }),
            R"(+Snapshot=
+Storage=
+Physical-disks=
*HDD:1=
interface="SATA"
mediatype=3
~type=media-type
partitions=3
*CD:1=
*CD:2=
model="PIONEER BD-RW"
*HDD:2=
interface="NVMe"
mediatype=3
~type=media-type
partitions=3
*HDD:3=
interface="SCSI"
mediatype="3"
~type=media-type
size=39
~base-value=39105677230
partitions=0
*CD:3=
model="HL-DT-ST DVD"
-
+Logical-disks=
*partition:1="Macintosh HD"
*partition:2="Vault"
kind="encrypted"
*partition:3="Old"
*partition:4="Free"
free=1.07
~base-value=1073741824
*partition:5="Bytes"
*partition:6="Mounted"
mount-point="/Volumes/M"
*partition:7="Spare"
free=5.00
~base-value=5000000000
-
-
-
)");
}

// Disk size "<gigabytes>/<bytes>" and the volume's used share, from odd inputs.
TEST(StorageSectionTest, SizeRoundingAndUsedShare) {
  const struct {
    const char *disk_key, *disk_size, *volume_size, *volume_free, *expected;
  } cases[] = {
      // 0.40 decimal gigabytes stays 0, 0.41 counts up to 1.
      {"size", "390625 KB", nullptr, nullptr, "0/400000000 -"},
      {"size", "400390,625 KB", nullptr, nullptr, "1/410000000 -"},
      {"size", "1e300 TB", nullptr, nullptr, "0/0 -"},
      {"size_in_bytes", "500107862016", nullptr, nullptr, "0/0 -"},
      {"size", nullptr, "30 GB", "3,35 GB", "- 88"},
      {"size", nullptr, "1 GB", "Zero KB", "- 100"},
      {"size", nullptr, "nan GB", "1 GB", "- -"},
  };
  for (const auto& c : cases) {
    TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
    const std::string disk = "/" + kSata + "item0/";
    raw.setValue(disk + "smart_status", "Verified");
    raw.setValue(disk + "volumes/item0/_name", "V");
    if (c.disk_size) raw.setValue(disk + c.disk_key, c.disk_size);
    if (c.volume_size) raw.setValue(disk + "volumes/item0/size", c.volume_size);
    if (c.volume_free) raw.setValue(disk + "volumes/item0/free_space", c.volume_free);
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

// Hubs nest; profilers of 10.5 and 10.6 put a letter before the descriptor
// keys; only the exact "yes" marks removable storage; an unmounted volume is
// neither written nor counted; a stick's volume already among the mounted
// volumes is counted but not written again; a "Media" entry without a byte
// count keeps the size of its text.
TEST(UsbSectionTest, DevicesAndRemovableDisksOfOddShapes) {
  const std::string hub = kUsb + "item0/_items/";
  FakeCommandRunner runner;
  runner.answer("diskutil info /dev/disk2",
                "   Device / Media Name:      Lexar USB Flash Drive Media\n   Protocol: USB\n");
  EXPECT_EQ(buildDisks(
                {
                    {kMounted + "item0/_name", "LEXAR"},
                    {kMounted + "item0/mount_point", "/Volumes/LEXAR"},
                    {hub + "item0/_name", "LaserJet"},
                    {hub + "item0/device_speed", "full_speed"},
                    {hub + "item0/bus_power_used", int64_t{2}},
                    {hub + "item1/_name", "JumpDrive"},
                    {hub + "item1/device_speed", "high_speed"},
                    {hub + "item1/bsd_name", "disk2"},
                    {hub + "item1/removable_media", "yes"},
                    {hub + "item1/size", "7,34 GB"},
                    {hub + "item1/size_in_bytes", int64_t{7881264988}},
                    {hub + "item1/volumes/item0/_name", "LEXAR"},
                    {hub + "item1/volumes/item0/mount_point", "/Volumes/LEXAR"},
                    {hub + "item1/volumes/item0/free_space", "3 GB"},
                    {hub + "item1/volumes/item1/_name", "EFI"},
                    {hub + "item1/volumes/item1/size", "1 GB"},
                    {kUsb + "item1/_name", "Card Reader"},
                    {kUsb + "item1/a_product_id", "0x8501"},
                    {kUsb + "item1/e_device_speed", "high_speed"},
                    {kUsb + "item1/removable_media", "Yes"},
                    {kUsb + "item2/_name", "Cruzer"},
                    {kUsb + "item2/device_speed", "low_speed"},
                    {kUsb + "item2/Media/item0/size", "8 GB"},
                    {kUsb + "item2/Media/item0/volumes/item0/_name", "CRUZER"},
                    {kUsb + "item2/Media/item0/volumes/item0/size", "8 GB"},
                    {kUsb + "item2/Media/item0/volumes/item0/free_space", "6 GB"},
                },
                runner),
            R"(+Snapshot=
+Storage=
+Logical-disks=
*partition:1="LEXAR"
mount-point="/Volumes/LEXAR"
*partition:2="CRUZER"
size=8.59
~base-value=8589934592
free=6.44
~base-value=6442450944
used%=25
~pos=2.15
~max=8.59
~val-units=GB
-
+Physical-disks=
*Removable:1="JumpDrive"
media-type="2"
device-speed="2"
model="Lexar USB Flash Drive"
size=8
~base-value=7881264988
interface="USB"
partitions=1
*Removable:2="Cruzer"
media-type="2"
device-speed="0"
size=9
interface="USB"
partitions=1
-
-
+Peripherals=
+USB=
*Device:1="LaserJet"
device-speed="12"
bus-power-used=2
*Device:2="Card Reader"
product-id="0x8501"
device-speed="480"
-
-
-
)");
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{"diskutil info /dev/disk2"});
}

TEST(UsbSectionTest, BsdNameReachesTheShellQuoted) {
  const std::vector<std::pair<TagValue, std::vector<std::string>>> cases = {
      {TagValue("disk2; touch /tmp/x"), {"diskutil info '/dev/disk2; touch /tmp/x'"}},
      {TagValue("disk2'$(reboot)'"), {"diskutil info '/dev/disk2'\\''$(reboot)'\\'''"}},
      {TagValue(""), {}},
      {TagValue(int64_t{2}), {}},
  };
  for (const auto& [bsd_name, commands] : cases) {
    FakeCommandRunner runner;
    buildDisks({{kUsb + "item0/removable_media", "yes"}, {kUsb + "item0/bsd_name", bsd_name}},
               runner);
    EXPECT_EQ(runner.commands_ran_, commands) << bsd_name.textForm();
  }
}

// Real trees nest a handful of hubs; a damaged one may nest without end.
TEST(UsbSectionTest, WalksNestedHubsUpToABound) {
  for (const std::string& items : {kUsb, kHost}) {
    Keys keys;
    std::string path = items;
    for (int depth = 0; depth < 200; ++depth) {
      if (depth == 5) keys.push_back({path + "item1/_name", "Keyboard"});
      path += "item0/_items/";
    }
    keys.push_back({path + "item0/_name", "Too deep"});
    EXPECT_EQ(buildDisks(keys),
              "+Snapshot=\n+Peripherals=\n+USB=\n*Device:1=\"Keyboard\"\n-\n-\n-\n")
        << items;
  }
}

// macOS 26 and later: the older type has buses but no devices, and the host
// type holds them under keys of its own; while the older type lists a
// device, the host type is not read.
TEST(UsbSectionTest, DevicesOfTheHostTypeWhenTheOlderTypeHasNone) {
  Keys keys = {{"SPUSBDataType/_items/item0/_name", "USB31Bus"},
               {kHost + "item0/_name", "Magic Keyboard"},
               {kHost + "item0/USBDeviceKeyProductID", "0x029c"},
               {kHost + "item0/USBDeviceKeyProductVersion", "0x0100"},
               {kHost + "item0/USBDeviceKeySerialNumber", "F0T1234XYZ"},
               {kHost + "item0/USBDeviceKeyVendorID", "0x05ac"},
               {kHost + "item0/USBDeviceKeyVendorName", "Apple Inc."},
               {kHost + "item0/USBKeyLocationID", "0x01100000"}};
  const std::pair<TagValue, const char*> speeds[] = {
      {TagValue("12 Mb/s"), "12"},   {TagValue("10 Gb/s"), "10000"},
      {TagValue("1,5 Mb/s"), "1.5"}, {TagValue("USB 2.0 (480 Mb/s)"), "480"},
      {TagValue("0 Mb/s"), ""},      {TagValue("fast"), ""},
      {TagValue(int64_t{480}), ""}};
  std::string expected = R"(+Snapshot=
+Peripherals=
+USB=
*Device:1="Magic Keyboard"
product-id="0x029c"
bcd-device="0x0100"
serial-number="F0T1234XYZ"
vendor-id="0x05ac"
manuf="Apple Inc."
)";
  for (size_t i = 0; i < std::size(speeds); ++i) {
    const std::string item = kHost + "item" + std::to_string(i + 1) + "/";
    keys.push_back({item + "_name", "D" + std::to_string(i)});
    keys.push_back({item + "USBDeviceKeyLinkSpeed", speeds[i].first});
    expected += "*Device:" + std::to_string(i + 2) + "=\"D" + std::to_string(i) + "\"\n";
    if (*speeds[i].second) expected += std::string("device-speed=\"") + speeds[i].second + "\"\n";
  }
  EXPECT_EQ(buildDisks(keys), expected + "-\n-\n-\n");
  keys.push_back({kUsb + "item0/_name", "IR Receiver"});
  EXPECT_EQ(buildDisks(keys),
            "+Snapshot=\n+Peripherals=\n+USB=\n*Device:1=\"IR Receiver\"\n-\n-\n-\n");
}

}  // namespace
}  // namespace cvn
