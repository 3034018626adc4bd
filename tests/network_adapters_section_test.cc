#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(NetworkAdaptersSectionTest, RecordsFollowRawPositionsWithTheirFields) {
  TagTree raw(true, "Macintosh");
  const std::string items = "/SPNetworkDataType/_items/";
  raw.setValue(items + "item0/_name", "Ethernet");
  raw.setValue(items + "item0/interface", "en0");
  raw.setValue(items + "item0/ip_address/item0", "10.0.1.2");
  raw.setValue(items + "item0/SubnetMasks/item0", "255.255.255.0");
  raw.setValue(items + "item0/SubnetMasks/item1", 0);
  raw.setValue(items + "item0/SubnetMasks/item2", "255.255.0.0");
  raw.setValue(items + "item0/Ethernet/MAC_Address", "00:1a:2b:3c:4d:5e");
  // item1 to item8: the converter stored nothing for them; their numbers stay unused.
  raw.setValue(items + "item9/_name", 3);
  raw.setValue(items + "item9/Ethernet/MAC_Address", "d4:9a");
  // Masks kept only in the IPv4 settings, as real profilers keep them.
  raw.setValue(items + "item9/IPv4/SubnetMasks/item0", "255.0.0.0");
  raw.setValue(items + "item9/IPv4/Router", "10.0.0.1");
  TagTree snapshot(true, "Snapshot");
  buildNetworkAdaptersSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Network")), R"txt(+Network=
+Adapters=
*net-adapter:1="Ethernet"
bsd-device-name="en0"
ip-address="10.0.1.2"
ip-subnet="255.255.255.0, , 255.255.0.0"
manuf-by-mac="00-1A-2B"
mac-address="00-1A-2B-3C-4D-5E"
*net-adapter:10=3
ip-subnet="255.0.0.0"
manuf-by-mac="D4-9A"
mac-address="D4-9A"
default-gateway="10.0.0.1"
-
-
)txt");
}

}  // namespace
}  // namespace cvn
