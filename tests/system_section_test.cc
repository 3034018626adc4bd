#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

// Without "platform_UUID" the builder takes ioreg's and keeps at most 40 bytes.
TEST(SystemSectionTest, HardwareMemorySlotsAndPowerProfiles) {
  const std::string ioreg_uuid = std::string(36, 'A') + "BCDEFGHIJK";
  TagTree raw(true, "Macintosh");
  raw.setValue("/SPHardwareDataType/_items/item0/machine_model", "MacBookPro8,2");
  raw.setValue("/SPHardwareDataType/_items/item0/serial_number", 12345);
  // Slot numbers restart in every bank group, so the second group overwrites
  // slot 1; a flat entry is numbered by its raw position (item1 missing: the
  // converter stored nothing for it). Only "ok" counts as used.
  const std::string mem = "/SPMemoryDataType/_items/";
  raw.setValue(mem + "item0/_items/item0/dimm_status", "ok");
  raw.setValue(mem + "item0/_items/item0/dimm_size", "4 GB");
  raw.setValue(mem + "item2/_items/item0/dimm_status", "ok");
  raw.setValue(mem + "item2/_items/item0/dimm_size", "512 MB");
  raw.setValue(mem + "item3/dimm_status", "OK");
  // Only "Yes" switches on; timers keep their kind; other power items are skipped.
  const std::string power = "/SPPowerDataType/_items/item1/";
  raw.setValue("/SPPowerDataType/_items/item0/_name", "spbattery_information");
  raw.setValue(power + "_name", "sppower_information");
  raw.setValue(power + "AC_Power/System_Sleep_Timer", 0);
  raw.setValue(power + "AC_Power/Wake_On_LAN", "Yes");
  raw.setValue(power + "AC_Power/Wake_On_AC_Change", "yes");
  raw.setValue(power + "AC_Power/Wake_On_Clamshell_Open", 1);
  TagTree snapshot(true, "Snapshot");
  buildSystemSection(snapshot, raw, ioreg_uuid);
  EXPECT_EQ(treeText(snapshot.top().findChild("System")), R"txt(+System=
*Computer-system=
model="MacBookPro8,2"
uuid="AAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAABCDE"
*Chassis=
manuf="Apple Inc."
serial=12345
+Mem-slots=
mem-slot:1=""
~complex=
mem-slot:4=""
~complex=
*mem-slot:1=
used="1"
capacity=512
~base-value=536870912
*mem-slot:4=
used="0"
-
+PowerManagement=
*Profile:1="AC Power"
system-sleep-timer=0
wake-on-lan="1"
wake-on-ac-change="0"
wake-on-clamshell-open="0"
-
-
)txt");
}

}  // namespace
}  // namespace cvn
