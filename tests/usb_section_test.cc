#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

constexpr const char* kBus0 = "/SPUSBDataType/_items/item0/_items/";

void setKeys(TagTree& raw, const std::string& prefix,
             const std::vector<std::pair<const char*, TagValue>>& keys) {
  for (const auto& [key, value] : keys) raw.setValue(prefix + key, value);
}

TEST(UsbSectionTest, HubsDevicesAndFlashDriveAfterInternalDisks) {
  TagTree raw(true, "Macintosh");
  const std::string sata = "/SPSerialATADataType/_items/item0/_items/item0/";
  raw.setValue(sata + "smart_status", TagValue("Verified"));
  raw.setValue(sata + "volumes/item0/_name", TagValue("Macintosh HD"));
  const std::string hub = std::string(kBus0) + "item0/";
  setKeys(raw, hub + "_items/item0/",
          {{"_name", TagValue("LaserJet")},
           {"device_speed", TagValue("full_speed")},
           {"bus_power_used", TagValue(int64_t{2})}});
  const std::string stick = hub + "_items/item1/";
  setKeys(raw, stick,
          {{"_name", TagValue("JumpDrive")},
           {"device_speed", TagValue("high_speed")},
           {"bsd_name", TagValue("disk2")},
           {"removable_media", TagValue("yes")},
           {"size", TagValue("7,34 GB")},
           {"size_in_bytes", TagValue(int64_t{7881264988})}});
  setKeys(raw, stick + "volumes/item0/",
          {{"_name", TagValue("LEXAR")}, {"free_space", TagValue("3 GB")}});
  // Not mounted: no free space, so neither written nor counted.
  setKeys(raw, stick + "volumes/item1/", {{"_name", TagValue("EFI")}, {"size", TagValue("1 GB")}});
  // Profilers of 10.5 and 10.6 put a letter before the descriptor keys; only
  // the exact lower-case "yes" marks removable storage.
  setKeys(raw, "/SPUSBDataType/_items/item1/_items/item0/",
          {{"_name", TagValue("Card Reader")},
           {"a_product_id", TagValue("0x8501")},
           {"e_device_speed", TagValue("high_speed")},
           {"removable_media", TagValue("Yes")}});

  TagTree snapshot(true, "Snapshot");
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  FakeCommandRunner runner;
  runner.answer("diskutil info /dev/disk2",
                "   Device / Media Name:      Lexar USB Flash Drive Media\n   Protocol: USB\n");
  buildUsbSection(snapshot, raw, runner, volumes);
  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+Storage=
+Physical-disks=
*HDD:1=
interface="SATA"
mediatype=3
~type=media-type
partitions=1
*Removable:1="JumpDrive"
media-type="2"
device-speed="2"
model="Lexar USB Flash Drive"
size=8
~base-value=7881264988
interface="USB"
partitions=1
-
+Logical-disks=
*partition:1="Macintosh HD"
*partition:2="LEXAR"
free=3.22
~base-value=3221225472
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
}

TEST(UsbSectionTest, BsdNameReachesTheShellQuoted) {
  const std::vector<std::pair<TagValue, std::vector<std::string>>> cases = {
      {TagValue("disk2; touch /tmp/x"), {"diskutil info '/dev/disk2; touch /tmp/x'"}},
      {TagValue("disk2'$(reboot)'"), {"diskutil info '/dev/disk2'\\''$(reboot)'\\'''"}},
      {TagValue(""), {}},
      {TagValue(int64_t{2}), {}},
  };
  for (const auto& [bsd_name, commands] : cases) {
    TagTree raw(true, "Macintosh");
    setKeys(raw, std::string(kBus0) + "item0/",
            {{"removable_media", TagValue("yes")}, {"bsd_name", bsd_name}});
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    WrittenVolumes volumes;
    buildUsbSection(snapshot, raw, runner, volumes);
    EXPECT_EQ(runner.commands_ran_, commands) << bsd_name.textForm();
  }
}

// Real trees nest a handful of hubs; a damaged one may nest without end.
TEST(UsbSectionTest, WalksNestedHubsUpToABound) {
  TagTree raw(true, "Macintosh");
  std::string path = kBus0;
  for (int depth = 0; depth < 200; ++depth) {
    if (depth == 5) raw.setValue(path + "item1/_name", TagValue("Keyboard"));
    path += "item0/_items/";
  }
  raw.setValue(path + "item0/_name", TagValue("Too deep"));
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  WrittenVolumes volumes;
  buildUsbSection(snapshot, raw, runner, volumes);
  EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")),
            "+Peripherals=\n+USB=\n*Device:1=\"Keyboard\"\n-\n-\n");
}

// Today's profilers: the stick's disk sits in a "Media" list, with a
// decimal size text beside its byte count, and its volume is already among
// the mounted volumes of the disk section.
TEST(UsbSectionTest, AStickWhoseDiskSitsInAMediaList) {
  TagTree raw(true, "Macintosh");
  raw.setValue("/SPUSBDataType/_items/item0/host_controller", TagValue("AppleT6000USBXHCI"));
  const std::string stick = "/SPUSBDataType/_items/item1/_items/item0/";
  setKeys(raw, stick,
          {{"_name", TagValue("Extreme Flash")},
           {"bcd_device", TagValue("1.00")},
           {"device_speed", TagValue("super_speed")},
           {"manufacturer", TagValue("SanDisk")},
           {"product_id", TagValue("0x5581")},
           {"serial_num", TagValue("4C530001")},
           {"vendor_id", TagValue("0x0781  (SanDisk Corporation)")}});
  setKeys(raw, stick + "Media/item0/",
          {{"_name", TagValue("HARMONY MSC")},
           {"bsd_name", TagValue("disk8")},
           {"removable_media", TagValue("yes")},
           {"size", TagValue("30,75 GB")},
           {"size_in_bytes", TagValue(int64_t{30752636928})},
           {"smart_status", TagValue("Verified")}});
  const std::vector<std::pair<const char*, TagValue>> volume = {
      {"_name", TagValue("STICK")},
      {"bsd_name", TagValue("disk8s1")},
      {"file_system", TagValue("MS-DOS FAT32")},
      {"mount_point", TagValue("/Volumes/STICK")},
      {"size", TagValue("3,9 GB")},
      {"size_in_bytes", TagValue(int64_t{3900000000})},
      {"free_space", TagValue("1,2 GB")},
      {"free_space_in_bytes", TagValue(int64_t{1200000000})}};
  setKeys(raw, stick + "Media/item0/volumes/item0/", volume);
  setKeys(raw, "/SPStorageDataType/_items/item0/", volume);
  // A second stick's volume that only the USB list knows.
  const std::string other = "/SPUSBDataType/_items/item1/_items/item1/";
  setKeys(raw, other, {{"_name", TagValue("Cruzer")}, {"device_speed", TagValue("high_speed")}});
  setKeys(raw, other + "Media/item0/", {{"_name", TagValue("Cruzer")}, {"size", TagValue("8 GB")}});
  setKeys(raw, other + "Media/item0/volumes/item0/",
          {{"_name", TagValue("CRUZER")},
           {"mount_point", TagValue("/Volumes/CRUZER")},
           {"size", TagValue("8 GB")},
           {"free_space", TagValue("6 GB")}});

  TagTree snapshot(true, "Snapshot");
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  FakeCommandRunner runner;
  runner.answer("diskutil info /dev/disk8", "   Device / Media Name:      HARMONY MSC Media\n");
  buildUsbSection(snapshot, raw, runner, volumes);
  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+Storage=
+Logical-disks=
*partition:1="STICK"
file-sys="MS-DOS FAT32"
size=3.90
~base-value=3900000000
free=1.20
~base-value=1200000000
mount-point="/Volumes/STICK"
used%=69
~pos=2.70
~max=3.90
~val-units=GB
*partition:2="CRUZER"
mount-point="/Volumes/CRUZER"
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
*Removable:1="Extreme Flash"
media-type="2"
bcd-device="1.00"
device-speed="2"
manufacturer="SanDisk"
serial="4C530001"
model="HARMONY MSC"
size=31
~base-value=30752636928
interface="USB"
partitions=1
*Removable:2="Cruzer"
media-type="2"
device-speed="2"
size=9
interface="USB"
partitions=1
-
-
-
)");
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{"diskutil info /dev/disk8"});
}

// macOS 26 and later: the older type has buses but no devices, and the host
// type holds them under keys of its own.
TEST(UsbSectionTest, DevicesOfTheHostTypeWhenTheOlderTypeHasNone) {
  TagTree raw(true, "Macintosh");
  raw.setValue("/SPUSBDataType/_items/item0/_name", TagValue("USB31Bus"));
  const std::string bus = "/SPUSBHostDataType/_items/item0/";
  setKeys(raw, bus,
          {{"_name", TagValue("USB 3.1 Bus")}, {"Driver", TagValue("AppleT8112USBXHCI")}});
  setKeys(raw, bus + "_items/item0/", {{"_name", TagValue("USB2.0 Hub")}});
  setKeys(raw, bus + "_items/item0/_items/item0/",
          {{"_name", TagValue("Magic Keyboard")},
           {"USBDeviceKeyLinkSpeed", TagValue("12 Mb/s")},
           {"USBDeviceKeyProductID", TagValue("0x029c")},
           {"USBDeviceKeyProductVersion", TagValue("0x0100")},
           {"USBDeviceKeySerialNumber", TagValue("F0T1234XYZ")},
           {"USBDeviceKeyVendorID", TagValue("0x05ac")},
           {"USBDeviceKeyVendorName", TagValue("Apple Inc.")},
           {"USBKeyLocationID", TagValue("0x01100000")}});
  const std::pair<const char*, TagValue> speeds[] = {{"Extreme SSD", TagValue("10 Gb/s")},
                                                     {"Mouse", TagValue("1,5 Mb/s")},
                                                     {"Dongle", TagValue("USB 2.0 (480 Mb/s)")},
                                                     {"Odd", TagValue("fast")},
                                                     {"Counted", TagValue(int64_t{480})}};
  for (size_t i = 0; i < 5; ++i) {
    setKeys(raw, bus + "_items/item" + std::to_string(i + 1) + "/",
            {{"_name", TagValue(speeds[i].first)}, {"USBDeviceKeyLinkSpeed", speeds[i].second}});
  }
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  WrittenVolumes volumes;
  buildUsbSection(snapshot, raw, runner, volumes);
  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+Peripherals=
+USB=
*Device:1="Magic Keyboard"
device-speed="12"
product-id="0x029c"
bcd-device="0x0100"
serial-number="F0T1234XYZ"
vendor-id="0x05ac"
manuf="Apple Inc."
*Device:2="Extreme SSD"
device-speed="10000"
*Device:3="Mouse"
device-speed="1.5"
*Device:4="Dongle"
device-speed="480"
*Device:5="Odd"
*Device:6="Counted"
-
-
-
)");

  // While the older type lists a device, the host type is not read.
  raw.setValue("/SPUSBDataType/_items/item0/_items/item0/_name", TagValue("IR Receiver"));
  TagTree older(true, "Snapshot");
  WrittenVolumes older_volumes;
  buildUsbSection(older, raw, runner, older_volumes);
  EXPECT_EQ(treeText(older.top().findChild("Peripherals")), R"(+Peripherals=
+USB=
*Device:1="IR Receiver"
-
-
)");
}

}  // namespace
}  // namespace cvn
