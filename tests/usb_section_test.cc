#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

constexpr const char* kBus0 = "/SPUSBDataType/_items/item0/_items/";

void setKeys(TagTree& raw, const std::string& prefix,
             const std::vector<std::pair<const char*, TagValue>>& keys) {
  for (const auto& [key, value] : keys) raw.setValue(prefix + key, value);
}

// The disks a storage scan leaves before the USB builder runs: two SATA
// disks with three volumes between them.
void addInternalDisks(TagTree& raw) {
  const std::string sata = "/SPSerialATADataType/_items/item0/_items/";
  raw.setValue(sata + "item0/smart_status", TagValue("Verified"));
  raw.setValue(sata + "item0/volumes/item0/_name", TagValue("Macintosh HD"));
  raw.setValue(sata + "item0/volumes/item1/_name", TagValue("Recovery HD"));
  raw.setValue(sata + "item1/smart_status", TagValue("Verified"));
  raw.setValue(sata + "item1/volumes/item0/_name", TagValue("Data"));
}

TEST(UsbSectionTest, HubWithPrinterAndFlashDriveAfterInternalDisks) {
  TagTree raw(true, "Macintosh");
  addInternalDisks(raw);
  const std::string hub = std::string(kBus0) + "item0/";
  setKeys(raw, hub,
          {{"_name", TagValue("USB2.0 Hub")},
           {"product_id", TagValue("0x2504")},
           {"device_speed", TagValue("high_speed")}});
  setKeys(raw, hub + "_items/item0/",
          {{"_name", TagValue("HP LaserJet 1020")},
           {"product_id", TagValue("0x2b17")},
           {"vendor_id", TagValue("0x03f0  (Hewlett Packard)")},
           {"bcd_device", TagValue("1.00")},
           {"serial_num", TagValue("FN0BM1C")},
           {"device_speed", TagValue("full_speed")},
           {"manufacturer", TagValue("Hewlett-Packard")},
           {"bus_power", TagValue("500")},
           {"bus_power_used", TagValue(int64_t{2})},
           {"location_id", TagValue("0xfd310000 / 3")}});
  const std::string stick = hub + "_items/item1/";
  setKeys(raw, stick,
          {{"_name", TagValue("JumpDrive")},
           {"product_id", TagValue("0xa202")},
           {"vendor_id", TagValue("0x05dc")},
           {"bcd_device", TagValue("11.00")},
           {"serial_num", TagValue("AASOP1QMSZ0XG051")},
           {"device_speed", TagValue("high_speed")},
           {"manufacturer", TagValue("Lexar")},
           {"bus_power", TagValue("500")},
           {"bus_power_used", TagValue("200")},
           {"bsd_name", TagValue("disk2")},
           {"removable_media", TagValue("yes")},
           {"size", TagValue("7,34 GB")},
           {"size_in_bytes", TagValue(int64_t{7881264988})},
           {"smart_status", TagValue("Not Supported")}});
  setKeys(raw, stick + "volumes/item0/",
          {{"_name", TagValue("LEXAR")},
           {"bsd_name", TagValue("disk2s1")},
           {"file_system", TagValue("MS-DOS FAT32")},
           {"free_space", TagValue("3,2 GB")},
           {"free_space_in_bytes", TagValue(int64_t{3200000000})},
           {"mount_point", TagValue("/Volumes/LEXAR")},
           {"size", TagValue("7,33 GB")},
           {"size_in_bytes", TagValue(int64_t{8000000000})}});
  // Not mounted: no free space, so neither written nor counted.
  setKeys(raw, stick + "volumes/item1/",
          {{"_name", TagValue("EFI")}, {"size", TagValue("209,7 MB")}});

  TagTree snapshot(true, "Snapshot");
  buildStorageSection(snapshot, raw);
  FakeCommandRunner runner;
  runner.answer("diskutil info /dev/disk2",
                "   Device Identifier:        disk2\n"
                "   Device / Media Name:      Lexar USB Flash Drive Media\n"
                "   Protocol:                 USB\n");
  buildUsbSection(snapshot, raw, runner);

  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{"diskutil info /dev/disk2"});
  EXPECT_EQ(runner.chunk_sizes_, std::vector<size_t>{200});
  EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")), R"x(+Peripherals=
+USB=
*Device:1="HP LaserJet 1020"
product-id="0x2b17"
vendor-id="0x03f0  (Hewlett Packard)"
bcd-device="1.00"
serial-number="FN0BM1C"
device-speed="12"
manuf="Hewlett-Packard"
bus-power="500"
bus-power-used=2
-
-
)x");
  EXPECT_EQ(treeText(snapshot.top().findChild("Storage")), R"(+Storage=
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
partitions=1
*Removable:1="JumpDrive"
media-type="2"
bcd-device="11.00"
serial="AASOP1QMSZ0XG051"
device-speed="2"
manufacturer="Lexar"
bus-power="500"
bus-power-used="200"
model="Lexar USB Flash Drive"
size=8
~base-value=7881264988
interface="USB"
partitions=1
-
+Logical-disks=
*partition:1="Macintosh HD"
*partition:2="Recovery HD"
*partition:3="Data"
*partition:4="LEXAR"
file-sys="MS-DOS FAT32"
bsd-name="disk2s1"
mount-point="/Volumes/LEXAR"
size=8.00
~base-value=8000000000
free=3.20
~base-value=3200000000
used%=60
~pos=4.80
~max=8.00
~val-units=GB
-
-
)");
}

TEST(UsbSectionTest, SortsDevicesByRemovableMediaAndSkipsEmptyHubs) {
  TagTree raw(true, "Macintosh");
  // Only the exact lower-case "yes" marks removable storage.
  setKeys(raw, std::string(kBus0) + "item0/",
          {{"_name", TagValue("Card Reader")}, {"removable_media", TagValue("Yes")}});
  // A hub whose list is empty records nothing, not even itself.
  raw.setValue(std::string(kBus0) + "item1/_name", TagValue("Empty Hub"));
  raw.top()
      .findChild("SPUSBDataType")
      ->findChild("_items")
      ->findChild("item0")
      ->findChild("_items")
      ->findChild("item1")
      ->addChild("_items");
  // The device counter runs on across buses; a bus without devices is passed.
  raw.setValue("/SPUSBDataType/_items/item1/_name", TagValue("USB Bus"));
  setKeys(raw, "/SPUSBDataType/_items/item2/_items/item0/",
          {{"_name", TagValue("Stick")}, {"removable_media", TagValue("yes")}});
  raw.setValue("/SPUSBDataType/_items/item2/_items/item1/_name", TagValue("Mouse"));

  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  buildUsbSection(snapshot, raw, runner);
  EXPECT_EQ(runner.commands_ran_, std::vector<std::string>{});
  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+Peripherals=
+USB=
*Device:1="Card Reader"
*Device:2="Mouse"
-
-
+Storage=
+Physical-disks=
*Removable:1="Stick"
media-type="2"
interface="USB"
partitions=0
-
-
-
)");
}

TEST(UsbSectionTest, SpeedCodesDifferByNodeKind) {
  struct Case {
    TagValue speed;
    const char* device;
    const char* removable;
  };
  const std::vector<Case> cases = {
      {TagValue("full_speed"), "device-speed=\"12\"\n", "device-speed=\"1\"\n"},
      {TagValue("low_speed"), "device-speed=\"1.5\"\n", "device-speed=\"0\"\n"},
      {TagValue("high_speed"), "device-speed=\"480\"\n", "device-speed=\"2\"\n"},
      {TagValue("super_speed"), "", "device-speed=\"2\"\n"},
      {TagValue(int64_t{12}), "", "device-speed=\"2\"\n"},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    raw.setValue(std::string(kBus0) + "item0/device_speed", c.speed);
    raw.setValue(std::string(kBus0) + "item1/device_speed", c.speed);
    raw.setValue(std::string(kBus0) + "item1/removable_media", TagValue("yes"));
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    buildUsbSection(snapshot, raw, runner);
    EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")->firstChild()->firstChild()),
              std::string("*Device:1=\n") + c.device)
        << c.speed.textForm();
    EXPECT_EQ(treeText(snapshot.top().findChild("Storage")->firstChild()->firstChild()),
              std::string("*Removable:1=\nmedia-type=\"2\"\n") + c.removable +
                  "interface=\"USB\"\npartitions=0\n")
        << c.speed.textForm();
  }
}

TEST(UsbSectionTest, MediaNameFromDiskutil) {
  struct Case {
    const char* output;
    const char* model;
  };
  const std::vector<Case> cases = {
      {"   Device / Media Name:      Flash Disk Media\n", "model=\"Flash Disk\"\n"},
      {"Device / Media Name:Media\n Media\n", "model=\"Media\"\n"},
      {"   Device / Media Name:      Flash Disk\n   Protocol: USB\n", ""},
      {"   Device / Media Name:      Flash Disk Media", ""},
      {"   Media Name:      Flash Disk Media\n", ""},
      {"", ""},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    setKeys(raw, std::string(kBus0) + "item0/",
            {{"bsd_name", TagValue("disk3")}, {"removable_media", TagValue("yes")}});
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    runner.answer("diskutil info /dev/disk3", c.output);
    buildUsbSection(snapshot, raw, runner);
    EXPECT_EQ(treeText(snapshot.top().findChild("Storage")->firstChild()->firstChild()),
              std::string("*Removable:1=\nmedia-type=\"2\"\n") + c.model +
                  "interface=\"USB\"\npartitions=0\n")
        << c.output;
  }
}

TEST(UsbSectionTest, BsdNameReachesTheShellQuoted) {
  struct Case {
    TagValue bsd_name;
    std::vector<std::string> commands;
  };
  const std::vector<Case> cases = {
      {TagValue("disk2; touch /tmp/x"), {"diskutil info '/dev/disk2; touch /tmp/x'"}},
      {TagValue("disk2'$(reboot)'"), {"diskutil info '/dev/disk2'\\''$(reboot)'\\'''"}},
      {TagValue("disk4s1"), {"diskutil info /dev/disk4s1"}},
      {TagValue(""), {}},
      {TagValue(int64_t{2}), {}},
  };
  for (const Case& c : cases) {
    TagTree raw(true, "Macintosh");
    setKeys(raw, std::string(kBus0) + "item0/",
            {{"removable_media", TagValue("yes")}, {"bsd_name", c.bsd_name}});
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    buildUsbSection(snapshot, raw, runner);
    EXPECT_EQ(runner.commands_ran_, c.commands) << c.bsd_name.textForm();
  }
}

// Profilers of 10.5 and 10.6 put a letter before the descriptor keys.
TEST(UsbSectionTest, ReadsLetterPrefixedKeysOfOldProfilers) {
  TagTree raw(true, "Macintosh");
  setKeys(raw, std::string(kBus0) + "item0/",
          {{"_name", TagValue("Built-in iSight")},
           {"a_product_id", TagValue("0x8501")},
           {"b_vendor_id", TagValue("apple_vendor_id")},
           {"c_bcd_device", TagValue(" 1.84")},
           {"d_serial_num", TagValue("8T8AH11")},
           {"e_device_speed", TagValue("high_speed")},
           {"f_manufacturer", TagValue("Micron")},
           {"g_location_id", TagValue("0xfd400000")},
           {"h_bus_power", TagValue("500")},
           {"i_bus_power_desired", TagValue("248")},
           {"j_bus_power_used", TagValue("100")},
           {"x_size", TagValue("1 GB")}});
  setKeys(raw, std::string(kBus0) + "item1/",
          {{"_name", TagValue("UDisk")},
           {"c_bcd_device", TagValue(" 1.00")},
           {"d_serial_num", TagValue("131114")},
           {"e_device_speed", TagValue("full_speed")},
           {"f_manufacturer", TagValue("General ")},
           {"removable_media", TagValue("yes")},
           {"size", TagValue("1,88 GB")}});
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  buildUsbSection(snapshot, raw, runner);
  EXPECT_EQ(treeText(&snapshot.top()), R"(+Snapshot=
+Peripherals=
+USB=
*Device:1="Built-in iSight"
product-id="0x8501"
vendor-id="apple_vendor_id"
bcd-device=" 1.84"
serial-number="8T8AH11"
device-speed="480"
manuf="Micron"
bus-power="500"
bus-power-used="100"
-
-
+Storage=
+Physical-disks=
*Removable:1="UDisk"
media-type="2"
bcd-device=" 1.00"
serial="131114"
device-speed="1"
manufacturer="General "
size=2
interface="USB"
partitions=0
-
-
-
)");
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
  buildUsbSection(snapshot, raw, runner);
  EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")), R"(+Peripherals=
+USB=
*Device:1="Keyboard"
-
-
)");
}

TEST(UsbSectionTest, MissingDataTypeOrBusesWriteNothing) {
  FakeCommandRunner runner;
  TagTree raw(true, "Macintosh");
  TagTree snapshot(true, "Snapshot");
  buildUsbSection(snapshot, raw, runner);
  raw.setValue("/SPUSBDataType/_items/item0/_name", TagValue("USB Bus"));
  buildUsbSection(snapshot, raw, runner);
  EXPECT_EQ(treeText(&snapshot.top()), "*Snapshot=\n");
}

}  // namespace
}  // namespace cvn
