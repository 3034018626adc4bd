#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(DisplaysSectionTest, MonitorsCountAcrossAdaptersAndDecodeTheirEdid) {
  // A digital DEL monitor with one standard timing.
  std::string edid = "0x" + std::string(16, '0') + "10ac2ea0" + std::string(8, '0') +
                     "0c18010380000078ea" + std::string(26, '0') + "d1" + std::string(178, '0');
  TagTree raw(true, "Macintosh");
  auto set = [&raw](const std::string& path, const TagValue& value) {
    raw.setValue("/SPDisplaysDataType/_items/" + path, value);
  };
  set("item0/sppci_model", "ATI Radeon HD 5770");
  set("item0/spdisplays_ndrvs/item0/_name", "DELL U2410");
  set("item0/spdisplays_ndrvs/item0/spdisplays_main", "spdisplays_yes");
  set("item0/spdisplays_ndrvs/item0/_spdisplays_edid", edid);
  set("item1/spdisplays_vram_shared", "1,5 GB of Shared System Memory");
  set("item1/spdisplays_ndrvs/item0/_name", "spdisplays_display_connector");
  set("item1/spdisplays_ndrvs/item0/spdisplays_status", "spdisplays_not_connected");
  set("item1/spdisplays_ndrvs/item1/_name", "Color LCD");
  set("item1/spdisplays_ndrvs/item1/spdisplays_main", "spdisplays_no");

  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Video")), R"tree(+Video=
+Video-devices=
Video-adapter:1=""
~complex=
Video-adapter:2=""
~complex=
*Video-adapter:1=
model="ATI Radeon HD 5770"
vendor=
device-id=
revision-id=
bus=
*Video-adapter:2=
model=
vendor=
video-memory=1536
~base-value=1610612736
device-id=
revision-id=
bus=
-
+Monitors=
Monitor:1=""
~complex=
Monitor:2=""
~complex=
+Monitor:1=
name="DELL U2410"
resolution=
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
aspect-ratio=""
*Video-Modes=
v-mode:1="1920 x 1200 (16:10)"
-
*Monitor:2=
name="Color LCD"
resolution=
main-display="0"
-
-
)tree");
}

// Apple Silicon: the built-in panel has no EDID and names its resolution
// under a key of its own; a GPU without a display is an adapter only.
TEST(DisplaysSectionTest, AppleSiliconPanelsWithoutEdidAndAGpuWithoutDisplays) {
  TagTree raw(true, "Macintosh");
  auto set = [&raw](const std::string& path, const TagValue& value) {
    raw.setValue("/SPDisplaysDataType/_items/" + path, value);
  };
  set("item0/_name", "Apple M3 Pro");
  set("item0/sppci_model", "Apple M3 Pro");
  set("item0/sppci_cores", "18");
  set("item0/spdisplays_vendor", "sppci_vendor_Apple");
  set("item0/sppci_bus", "spdisplays_builtin");
  const std::string panel = "item0/spdisplays_ndrvs/item0/";
  set(panel + "_name", "Color LCD");
  set(panel + "_spdisplays_pixels", "3024 x 1964");
  set(panel + "_spdisplays_resolution", "1512 x 982 @ 120.00Hz");
  set(panel + "spdisplays_main", "spdisplays_yes");
  set(panel + "spdisplays_connection_type", "spdisplays_internal");
  set("item0/spdisplays_ndrvs/item1/_name", "LG HDR 4K");
  set("item0/spdisplays_ndrvs/item1/_spdisplays_pixels", "3840 x 2160");
  set("item1/sppci_model", "Apple M3 Pro (second GPU)");

  TagTree snapshot(true, "Snapshot");
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Video")), R"tree(+Video=
+Video-devices=
Video-adapter:1=""
~complex=
Video-adapter:2=""
~complex=
*Video-adapter:1=
model="Apple M3 Pro"
vendor="sppci_vendor_Apple"
device-id=
revision-id=
bus="spdisplays_builtin"
*Video-adapter:2=
model="Apple M3 Pro (second GPU)"
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
resolution="1512 x 982 @ 120.00Hz"
main-display="1"
*Monitor:2=
name="LG HDR 4K"
resolution="3840 x 2160"
main-display="0"
-
-
)tree");
}

}  // namespace
}  // namespace cvn
