#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

class MemorySectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildMemorySection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Memory"));
  }
  void set(const std::string& path, const TagValue& value) { raw_.setValue(path, value); }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(MemorySectionTest, NestedBanksCountAcrossGroupsWithoutGaps) {
  const std::string bank = "/SPMemoryDataType/_items/item0/_items/";
  set(bank + "item0/_name", TagValue("BANK 0/DIMM0"));
  set(bank + "item0/dimm_manufacturer", TagValue("0x802C"));
  set(bank + "item0/dimm_size", TagValue("4 GB"));
  set(bank + "item0/dimm_speed", TagValue("1067 MHz"));
  set(bank + "item0/dimm_status", TagValue("ok"));
  set(bank + "item0/dimm_type", TagValue("DDR3"));
  set(bank + "item2/_name", TagValue("BANK 1/DIMM0"));
  set(bank + "item2/dimm_size", TagValue("empty"));
  set(bank + "item2/dimm_status", TagValue("empty"));
  set("/SPMemoryDataType/_items/item1/_items/item0/dimm_status", TagValue("OK"));
  set("/SPMemoryDataType/_items/item1/_items/item0/dimm_speed", TagValue(int64_t{1333}));
  set("/SPHardwareDataType/_items/item0/physical_memory", TagValue("2 TB"));
  EXPECT_EQ(build(), R"txt(+Memory=
*Memory-slot:1=
used="1"
manuf="0x802C"
capacity=4096
mem-type="DDR3"
speed="1067"
bank-label="BANK 0/DIMM0"
*Memory-slot:2=
used="0"
manuf=
capacity=0
mem-type=
speed=""
bank-label="BANK 1/DIMM0"
*Memory-slot:3=
used="0"
manuf=
capacity=0
mem-type=
speed=""
bank-label=
*General-info=
physical-memory=2048000
-
)txt");
}

TEST_F(MemorySectionTest, FlatLayoutWritesTheMakerOnlyWhenPresent) {
  set("/SPMemoryDataType/_items/item0/_name", TagValue("DIMM0/J21"));
  set("/SPMemoryDataType/_items/item0/dimm_size", TagValue("512 MB"));
  set("/SPMemoryDataType/_items/item0/dimm_speed", TagValue(" 667  MHz"));
  set("/SPMemoryDataType/_items/item0/dimm_status", TagValue("ok"));
  set("/SPMemoryDataType/_items/item1/_name", TagValue("DIMM1/J22"));
  set("/SPMemoryDataType/_items/item1/dimm_manufacturer", TagValue(int64_t{44}));
  EXPECT_EQ(build(), R"txt(+Memory=
*Memory-slot:1=
used="1"
capacity=512
mem-type=
speed=""
bank-label="DIMM0/J21"
*Memory-slot:2=
used="0"
manuf=44
capacity=0
mem-type=
speed=""
bank-label="DIMM1/J22"
-
)txt");
}

TEST_F(MemorySectionTest, HardwareAloneGivesGeneralInfo) {
  set("/SPHardwareDataType/_items/item0/physical_memory", TagValue("4 GB"));
  EXPECT_EQ(build(), R"txt(+Memory=
*General-info=
physical-memory=4096
-
)txt");
}

TEST_F(MemorySectionTest, NoDataTypesNoSection) {
  set("/SPMemoryDataType/_name", TagValue("no _items"));
  set("/SPHardwareDataType/_items/x", TagValue("no item"));
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
