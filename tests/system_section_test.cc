#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "fake_command_runner.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

const char kUuidCommand[] =
    R"cmd(ioreg -rd1 -c IOPlatformExpertDevice | awk '/IOPlatformUUID/ { split($0, line, "\""); printf("%s", line[4]); }')cmd";

class SystemSectionTest : public ::testing::Test {
 protected:
  std::string build() {
    buildSystemSection(snapshot_, raw_, runner_);
    return treeText(snapshot_.top().findChild("System"));
  }
  void set(const std::string& path, const TagValue& value) { raw_.setValue(path, value); }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
  FakeCommandRunner runner_;
};

TEST_F(SystemSectionTest, HardwareKeysAreCopiedWithTheirKinds) {
  set("/SPHardwareDataType/_items/item0/machine_model", TagValue("MacBookPro8,2"));
  set("/SPHardwareDataType/_items/item0/platform_UUID", TagValue("DAB12AB3-1234"));
  set("/SPHardwareDataType/_items/item0/serial_number", TagValue(int64_t{12345}));
  set("/SPHardwareDataType/_items/item1/machine_model", TagValue("ignored"));
  EXPECT_EQ(build(), R"txt(+System=
*Computer-system=
model="MacBookPro8,2"
uuid="DAB12AB3-1234"
*Chassis=
manuf="Apple Inc."
serial=12345
-
)txt");
  EXPECT_TRUE(runner_.commands_ran_.empty());
}

TEST_F(SystemSectionTest, MissingUuidAsksIoregAndKeepsFortyBytes) {
  set("/SPHardwareDataType/_items/item0/cpu_type", TagValue("Intel Core i7"));
  runner_.answer(kUuidCommand, std::string(36, 'A') + "BCDEFGHIJK");
  EXPECT_EQ(build(), R"txt(+System=
*Computer-system=
model=""
uuid="AAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAAABCDE"
*Chassis=
manuf="Apple Inc."
-
)txt");
  EXPECT_EQ(runner_.commands_ran_, std::vector<std::string>{kUuidCommand});
  EXPECT_EQ(runner_.chunk_sizes_, std::vector<size_t>{40});
}

TEST_F(SystemSectionTest, MemorySlotsNumberByPositionAndRestartPerGroup) {
  // Group 1: an ok module and an empty slot; group 2 (item1 missing: the
  // converter stored nothing for it) overwrites slot 1 of group 1.
  set("/SPMemoryDataType/_items/item0/_items/item0/dimm_status", TagValue("ok"));
  set("/SPMemoryDataType/_items/item0/_items/item0/dimm_size", TagValue("4 GB"));
  set("/SPMemoryDataType/_items/item0/_items/item1/dimm_status", TagValue("empty"));
  set("/SPMemoryDataType/_items/item0/_items/item1/dimm_size", TagValue("4 GB"));
  set("/SPMemoryDataType/_items/item2/_items/item0/dimm_status", TagValue("ok"));
  set("/SPMemoryDataType/_items/item2/_items/item0/dimm_size", TagValue("512 MB"));
  EXPECT_EQ(build(), R"txt(+System=
+Mem-slots=
mem-slot:1=""
~complex=
mem-slot:2=""
~complex=
*mem-slot:1=
used="1"
capacity=512
~base-value=536870912
*mem-slot:2=
used="0"
-
-
)txt");
}

TEST_F(SystemSectionTest, FlatMemorySlotsFollowRawPositions) {
  set("/SPMemoryDataType/_items/item0/dimm_status", TagValue("OK"));
  set("/SPMemoryDataType/_items/item0/dimm_size", TagValue("2 GB"));
  set("/SPMemoryDataType/_items/item3/dimm_status", TagValue("ok"));
  set("/SPMemoryDataType/_items/item3/dimm_size", TagValue(int64_t{4}));
  set("/SPMemoryDataType/_items/item4/dimm_status", TagValue("ok"));
  set("/SPMemoryDataType/_items/item4/dimm_size", TagValue("1,5 GB"));
  EXPECT_EQ(build(), R"txt(+System=
+Mem-slots=
mem-slot:1=""
~complex=
mem-slot:4=""
~complex=
mem-slot:5=""
~complex=
*mem-slot:1=
used="0"
*mem-slot:4=
used="1"
capacity=0
~base-value=0
*mem-slot:5=
used="1"
capacity=1536
~base-value=1610612736
-
-
)txt");
}

TEST_F(SystemSectionTest, PowerProfilesConvertSwitchesAndKeepTimers) {
  set("/SPPowerDataType/_items/item0/_name", TagValue("spbattery_information"));
  set("/SPPowerDataType/_items/item0/sppower_battery_charge_info/x", TagValue(int64_t{1}));
  const std::string info = "/SPPowerDataType/_items/item1/";
  set(info + "_name", TagValue("sppower_information"));
  set(info + "AC_Power/System_Sleep_Timer", TagValue(int64_t{0}));
  set(info + "AC_Power/Display_Sleep_Timer", TagValue("30"));
  set(info + "AC_Power/Wake_On_LAN", TagValue("Yes"));
  set(info + "AC_Power/Wake_On_AC_Change", TagValue("yes"));
  set(info + "AC_Power/Wake_On_Clamshell_Open", TagValue(int64_t{1}));
  set(info + "AC_Power/Display_Sleep_Uses_Dim", TagValue("No"));
  set(info + "Battery_Power/ReduceBrightness", TagValue("Yes"));
  set(info + "Battery_Power/Disk_Sleep_Timer", TagValue(int64_t{10}));
  EXPECT_EQ(build(), R"txt(+System=
+PowerManagement=
*Profile:1="AC Power"
system-sleep-timer=0
display-sleep-timer="30"
wake-on-lan="1"
wake-on-ac-change="0"
wake-on-clamshell-open="0"
display-sleep-uses-dim="0"
*Profile:2="Battery_Power"
disk-sleep-timer=10
reduce-brightness="1"
-
-
)txt");
}

TEST_F(SystemSectionTest, PowerItemWithoutProfilesEndsTheBuilder) {
  set("/SPPowerDataType/_items/item0/_name", TagValue("sppower_information"));
  set("/SPPowerDataType/_items/item1/_name", TagValue("sppower_information"));
  set("/SPPowerDataType/_items/item1/AC_Power/Wake_On_LAN", TagValue("Yes"));
  EXPECT_EQ(build(), "");
}

TEST_F(SystemSectionTest, NoDataTypesNoSection) {
  set("/SPHardwareDataType/_name", TagValue("no items"));
  set("/SPMemoryDataType/_items/x", TagValue("an empty _items tag"));
  EXPECT_EQ(build(), "");
  EXPECT_TRUE(runner_.commands_ran_.empty());
}

}  // namespace
}  // namespace cvn
