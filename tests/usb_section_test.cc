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
  buildStorageSection(snapshot, raw);
  FakeCommandRunner runner;
  runner.answer("diskutil info /dev/disk2",
                "   Device / Media Name:      Lexar USB Flash Drive Media\n   Protocol: USB\n");
  buildUsbSection(snapshot, raw, runner);
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
    buildUsbSection(snapshot, raw, runner);
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
  buildUsbSection(snapshot, raw, runner);
  EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")),
            "+Peripherals=\n+USB=\n*Device:1=\"Keyboard\"\n-\n-\n");
}

}  // namespace
}  // namespace cvn
