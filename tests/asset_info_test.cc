#include "asset/asset_info.h"

#include <gtest/gtest.h>

#include "collect/quick_facts.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(AssetInfoTest, VirtualTypeIgnoresCaseAndTakesTheFirstHit) {
  const std::pair<const char*, const char*> cases[] = {
      {"VMware7,1", "nvtVMware"},
      {"VirtualBox", "nvtVirtualBox"},
      {"Parallels-ARM", "nvtParallels"},
      {"MacBookPro5,5", "nvtPhysical"},
      {"", "nvtPhysical"},
      {"vmware parallels", "nvtVMware"},
  };
  for (const auto& c : cases) EXPECT_EQ(virtualTypeOf(c.first), c.second) << c.first;
}

TEST(AssetInfoTest, WritesIdentityAndControlSummary) {
  TagTree snapshot(true, "Snapshot");
  Tag& os = snapshot.top().addChild("OS").addChild("os:1");
  os.setProperty("name", TagValue("Mac OS X v10.6 (Snow Leopard)"));
  os.setProperty("version", TagValue("10.6.8 (10K549)"));
  os.setProperty("architecture", TagValue("32-bit"));  // no "update": os-sp is left out
  Tag& disks = snapshot.top().addChild("Storage").addChild("Logical-disks");
  Tag& p1 = disks.setChildValue("partition:1", TagValue("Macintosh HD"));
  p1.setProperty("free", TagValue(62.5), "base-value", "62500000000");
  p1.setProperty("mount-point", TagValue("/"));
  p1.setProperty("used%", TagValue(int64_t{75}), "pos", "187.50");
  disks.setChildValue("partition:2", TagValue("No free space known"));
  Tag& p3 = disks.setChildValue("partition:3", TagValue("Stick"));
  p3.setProperty("free", TagValue(1.0), "base-value", "1000000000");
  p3.setProperty("mount-point", TagValue("/Volumes/Stick"));
  Tag& monitors = snapshot.top().addChild("Video").addChild("Monitors");
  monitors.addChild("Monitor:1");
  monitors.addChild("Monitor:2");

  QuickFacts facts;
  facts.user_name = "jane";
  facts.platform_uuid = "UUID-1";
  facts.package_count = "1";
  facts.processor_count = "2";
  facts.processor_speed = "2260";
  facts.processor_model = "Intel Core 2 Duo";
  facts.processor_maker = "GenuineIntel";
  facts.machine_model = "MacBookPro5,5";
  facts.system_maker = "Apple Inc.";
  facts.physical_memory = "4096";
  facts.video_memory = "256";
  facts.main_display_resolution = "1280 x 800";
  // A 29 x 18 cm panel: 13 inches across.
  facts.main_display_edid =
      "0x00ffffffffffff000610b69c000000000c130103801d12780aee91a3544c99260f505421080081000101010101"
      "010101010101010101bc1b00a050201730302036001eb31000001800000010000000000000000000000000000000"
      "0"
      "000fc00436f6c6f72204c43440a202020000000fa007140010101010101010101010a008a";
  facts.disk_capacity = "465.8";
  AssetIdentity id;
  id.workgroup = "WORKGROUP";
  id.computer_name = "Jane's MacBook";
  id.netbios_name = "janes-mbp";
  id.mac_address = "00-1A-2B-3C-4D-5E";
  id.serial_number = "W8812345XYZ";
  id.ip = "192.168.1.20";
  id.login = "admin";
  id.manual_ip = true;

  auto tree = buildAssetInfo(true, snapshot, "20131115213000.000000+60", facts, id);
  EXPECT_EQ(treeText(&tree->top()), R"x(+AssetInfo=
hostname="janes-mbp"
ip-address="192.168.1.20"
static-ip="1"
int-name="Jane's MacBook"
alias="Jane's MacBook"
description=""
comment=""
inv-number=""
login="admin"
user-name="jane"
asset-type="natMacOS"
virtual-type="nvtPhysical"
scan-type="nstSSH"
scan-subtype="sstService"
auto-icon-type="nitMacDesktop"
icon-type="nitMacDesktop"
first-scan="20131115213000.000000+60"
last-scan="20131115213000.000000+60"
snapshot-list="20131115213000.000000+60"
snapshot-types="mac:1"
mac-address="00-1A-2B-3C-4D-5E"
uuid="UUID-1"
serial-number="W8812345XYZ"
asset-tag="1234567890000"
+control=
domain="WORKGROUP"
os-name="Mac OS X v10.6 (Snow Leopard)"
os-ver="10.6.8 (10K549)"
os-manuf="Apple Inc."
os-arch="32-bit"
cpu-count="1"
cpu-count-virtual="2"
cpu-speed="2260"
cpu-model="Intel Core 2 Duo"
cpu-manuf="GenuineIntel"
system-model="MacBookPro5,5"
system-manuf="Apple Inc."
chassis-manuf="Apple Inc."
mb-manuf="Apple Inc."
phys-memory="4096"
video-ram="256"
video-res="1280 x 800"
monitor-count="2"
monitor-diag="13"
hdd-capacity="465.8"
disk:1=62.50
~free=62500000000
~free%=25
~sys=1
disk:3=1.00
~free=1000000000
fw-status="5"
-
-
)x");
}

TEST(AssetInfoTest, ASnapshotWithoutSectionsStillGivesTheSummary) {
  TagTree snapshot(true, "Snapshot");
  auto tree = buildAssetInfo(true, snapshot, "d", QuickFacts(), AssetIdentity());
  const Tag* control = tree->top().findChild("control");
  ASSERT_NE(control, nullptr);
  EXPECT_EQ(control->findProperty("os-name"), nullptr);
  EXPECT_EQ(control->findProperty("monitor-count")->value().text(), "0");
  EXPECT_EQ(control->findProperty("disk:1"), nullptr);
  EXPECT_EQ(tree->top().findProperty("virtual-type")->value().text(), "nvtPhysical");
}

}  // namespace
}  // namespace cvn
