#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

class NetworkAdaptersSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildNetworkAdaptersSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Network"));
  }
  void set(const std::string& path, const TagValue& value) {
    raw_.setValue("/SPNetworkDataType/_items/" + path, value);
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(NetworkAdaptersSectionTest, RecordsFollowRawPositionsWithTheirFields) {
  set("item0/_name", TagValue("Ethernet"));
  set("item0/interface", TagValue("en0"));
  set("item0/type", TagValue("Ethernet"));
  set("item0/ip_address/item0", TagValue("10.0.1.2"));
  set("item0/ip_address/item1", TagValue("192.168.0.11"));
  set("item0/SubnetMasks/item0", TagValue("255.255.255.0"));
  set("item0/SubnetMasks/item1", TagValue(int64_t{0}));
  set("item0/SubnetMasks/item2", TagValue("255.255.0.0"));
  set("item0/Ethernet/MAC_Address", TagValue("00:1a:2b:3c:4d:5e"));
  set("item0/IPv4/Router", TagValue("10.0.1.1"));
  set("item1/_name", TagValue("FireWire"));
  // item2: the converter stored nothing for it, and its number stays unused.
  set("item3/_name", TagValue(int64_t{3}));
  set("item3/interface", TagValue("fw0"));
  set("item3/Ethernet/MAC_Address", TagValue("d4:9a"));
  set("item3/IPv4/ConfigMethod", TagValue("DHCP"));
  set("item4/type", TagValue("PPP (PPPSerial)"));
  set("item4/Ethernet/MAC_Address", TagValue(int64_t{1}));
  EXPECT_EQ(build(), R"txt(+Network=
+Adapters=
*net-adapter:1="Ethernet"
bsd-device-name="en0"
type="Ethernet"
ip-address="10.0.1.2, 192.168.0.11"
ip-subnet="255.255.255.0, , 255.255.0.0"
manuf-by-mac="00-1A-2B"
mac-address="00-1A-2B-3C-4D-5E"
default-gateway="10.0.1.1"
*net-adapter:2="FireWire"
*net-adapter:4=3
bsd-device-name="fw0"
manuf-by-mac="D4-9A"
mac-address="D4-9A"
*net-adapter:5=""
type="PPP (PPPSerial)"
manuf-by-mac=""
mac-address=""
-
-
)txt");
}

TEST_F(NetworkAdaptersSectionTest, NoItemsNoSection) {
  raw_.setValue("/SPNetworkDataType/_items/note", TagValue("no children"));
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
