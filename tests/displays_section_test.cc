#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

constexpr char kItems[] = "/SPDisplaysDataType/_items/";

// A digital 52 x 32 cm DEL monitor with one standard timing (1920 x 1200)
// and range limits, as the profiler's hexadecimal text.
std::string monitorEdidText() {
  std::array<uint8_t, 128> edid{};
  edid[1] = edid[2] = edid[3] = edid[4] = edid[5] = edid[6] = 0xFF;
  edid[8] = 0x10;
  edid[9] = 0xAC;
  edid[10] = 0x2E;
  edid[11] = 0xA0;
  edid[16] = 12;
  edid[17] = 24;
  edid[18] = 1;
  edid[19] = 3;
  edid[20] = 0x80;
  edid[21] = 52;
  edid[22] = 32;
  edid[23] = 120;
  edid[24] = 0xEA;
  for (size_t i = 40; i < 54; ++i) edid[i] = 1;
  edid[38] = 209;
  const uint8_t range[] = {0, 0, 0, 0xFD, 0, 56, 76, 30, 83};
  for (size_t i = 0; i < sizeof range; ++i) edid[54 + i] = range[i];
  std::string text = "0x";
  for (uint8_t b : edid) {
    char pair[3];
    std::snprintf(pair, sizeof pair, "%02x", b);
    text += pair;
  }
  return text;
}

void setRaw(TagTree& raw, const std::string& path, const TagValue& value) {
  raw.setValue(kItems + path, value);
}

TEST(DisplaysSectionTest, OneAdapterWithAnEdidMonitor) {
  TagTree raw(true, "Macintosh");
  setRaw(raw, "item0/_name", "kHW_ATIItem");
  setRaw(raw, "item0/sppci_model", "ATI Radeon HD 5770");
  setRaw(raw, "item0/spdisplays_vendor", "ATI (0x1002)");
  setRaw(raw, "item0/spdisplays_vram", "1024 MB");
  setRaw(raw, "item0/spdisplays_device-id", "0x68b8");
  setRaw(raw, "item0/spdisplays_revision-id", "0x0000");
  setRaw(raw, "item0/sppci_bus", "spdisplays_pcie_device");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/_name", "DELL U2410");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/spdisplays_resolution", "1920 x 1200");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/spdisplays_main", "spdisplays_yes");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/_spdisplays_edid", monitorEdidText());

  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Video")), R"tree(+Video=
+Video-devices=
Video-adapter:1=""
~complex=
*Video-adapter:1=
model="ATI Radeon HD 5770"
vendor="ATI (0x1002)"
video-memory=1024
~base-value=1073741824
device-id="0x68b8"
revision-id="0x0000"
bus="spdisplays_pcie_device"
-
+Monitors=
Monitor:1=""
~complex=
+Monitor:1=
name="DELL U2410"
resolution="1920 x 1200"
main-display="1"
manufacturer="DEL"
product-code="FFFFFFA02E"
serial-number=""
manuf-week="12"
manuf-year="2014"
max-resolution="1920 x 1200"
video-input="Digital"
synch-input=""
~split=, 
serial-digital="0"
color-features="RGB color"
~split=, 
dpms-mode-support="Standby, Suspend, Active off"
~split=, 
gamma="2.20"
aspect-ratio="16:10"
max-visible-image-size=""
~complex=
h-freq=""
~complex=
v-freq=""
~complex=
*max-visible-image-size=
width="52"
height="32"
diagonal="24"
*h-freq=
min="30"
max="83"
*v-freq=
min="56"
max="76"
*Video-Modes=
v-mode:1="1920 x 1200 (16:10)"
-
-
-
)tree");
}

TEST(DisplaysSectionTest, MonitorsCountAcrossAdaptersAndSkipEmptyConnectors) {
  TagTree raw(true, "Macintosh");
  setRaw(raw, "item0/sppci_model", "Intel HD Graphics 3000");
  setRaw(raw, "item0/spdisplays_vram_shared", "1,5 GB of Shared System Memory");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/_name", "Color LCD");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/spdisplays_resolution", "1440 x 900");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/spdisplays_main", "spdisplays_yes");
  setRaw(raw, "item0/spdisplays_ndrvs/item0/_spdisplays_edid", "0x00ffffffffffff00");
  setRaw(raw, "item1/sppci_model", "NVIDIA GeForce 9400");
  setRaw(raw, "item1/spdisplays_vram", 256);  // not text: no size
  setRaw(raw, "item1/spdisplays_ndrvs/item0/_name", "spdisplays_display_connector");
  setRaw(raw, "item1/spdisplays_ndrvs/item0/spdisplays_status", "spdisplays_not_connected");
  setRaw(raw, "item1/spdisplays_ndrvs/item1/_name", "W2261");
  setRaw(raw, "item1/spdisplays_ndrvs/item1/spdisplays_main", "spdisplays_no");

  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Video")), R"tree(+Video=
+Video-devices=
Video-adapter:1=""
~complex=
Video-adapter:2=""
~complex=
*Video-adapter:1=
model="Intel HD Graphics 3000"
vendor=
video-memory=1536
~base-value=1610612736
device-id=
revision-id=
bus=
*Video-adapter:2=
model="NVIDIA GeForce 9400"
vendor=
device-id=
revision-id=
bus=
-
+Monitors=
Monitor:1=""
~complex=
Monitor:2=""
~complex=
*Monitor:1=
name="Color LCD"
resolution="1440 x 900"
main-display="1"
*Monitor:2=
name="W2261"
resolution=
main-display="0"
-
-
)tree");
}

TEST(DisplaysSectionTest, AdapterWithoutDisplaysStillGetsAnEmptyMonitorsNode) {
  TagTree raw(true, "Macintosh");
  setRaw(raw, "item0/sppci_model", "NVIDIA GeForce 9400");

  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  const Tag* video = snapshot.top().findChild("Video");
  ASSERT_NE(video, nullptr);
  const Tag* monitors = video->findChild("Monitors");
  ASSERT_NE(monitors, nullptr);
  EXPECT_TRUE(monitors->children().empty());
}

TEST(DisplaysSectionTest, NoDataTypeOrNoItemsLeavesNoSection) {
  TagTree raw(true, "Macintosh");
  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  raw.setValue("/SPDisplaysDataType/_SPCompletionInterval", TagValue(0.07));
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(snapshot.top().findChild("Video"), nullptr);
}

}  // namespace
}  // namespace cvn
