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

// What the sample Macs' results cannot show: sections missing or partial,
// a disk without free space keeping its number, a manual address.
TEST(AssetInfoTest, PartialSnapshotsLeaveOutWhatTheyLack) {
  TagTree partial(true, "Snapshot");
  partial.top().addChild("OS").addChild("os:1").setProperty("version", TagValue("10.6.8"));
  Tag& disks = partial.top().addChild("Storage").addChild("Logical-disks");
  Tag& p1 = disks.setChildValue("partition:1", TagValue("Macintosh HD"));
  p1.setProperty("free", TagValue(62.5), "base-value", "62500000000");
  p1.setProperty("mount-point", TagValue("/"));
  p1.setProperty("used%", TagValue(int64_t{75}), "pos", "187.50");
  disks.setChildValue("partition:2", TagValue("No free space known"));
  Tag& p3 = disks.setChildValue("partition:3", TagValue("Stick"));
  p3.setProperty("free", TagValue(1.0));
  p3.setProperty("mount-point", TagValue("/Volumes/Stick"));
  p3.setProperty("used%", TagValue("75"));
  const TagTree empty(true, "Snapshot");
  const std::string tail = "monitor-count=\"0\"\nmonitor-diag=\"\"\nhdd-capacity=\"\"\n";
  const struct {
    const TagTree* snapshot;
    std::vector<std::string> lines;  // runs of lines the summary holds
  } cases[] = {
      {&partial,
       {"static-ip=\"1\"\n",
        "domain=\"\"\nos-ver=\"10.6.8\"\nos-manuf=\"Apple Inc.\"\ncpu-count=\"\"\n",
        tail + "disk:1=62.50\n~free=62500000000\n~free%=25\n~sys=1\ndisk:3=1.00\nfw-status"}},
      {&empty,
       {"domain=\"\"\nos-manuf=\"Apple Inc.\"\ncpu-count", tail + "fw-status=\"5\"\n-\n-\n"}},
  };
  for (const auto& c : cases) {
    AssetIdentity id;
    id.manual_ip = c.snapshot == &partial;
    std::string text = treeText(&buildAssetInfo(true, *c.snapshot, "d", QuickFacts(), id)->top());
    for (const std::string& line : c.lines) EXPECT_NE(text.find(line), std::string::npos) << line;
  }
}

}  // namespace
}  // namespace cvn
