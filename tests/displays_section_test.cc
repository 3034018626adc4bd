#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

// Monitors are numbered across adapters, unused connectors are no monitor,
// the resolution comes from whichever key the profiler used, and video
// memory from the dedicated key before the shared one (the EDID fields show
// in both sample Macs' results).
TEST(DisplaysSectionTest, AdaptersMonitorsResolutionsAndVideoMemory) {
  TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
  for (const auto& [path, value] : std::initializer_list<std::pair<const char*, TagValue>>{
           {"item0/sppci_model", "ATI Radeon HD 5770"},
           {"item0/spdisplays_vram", "1024 MB"},
           {"item0/spdisplays_ndrvs/item0/_name", "DELL U2410"},
           {"item0/spdisplays_ndrvs/item0/spdisplays_main", "spdisplays_yes"},
           {"item0/spdisplays_ndrvs/item0/spdisplays_resolution", "1920 x 1200"},
           {"item0/spdisplays_ndrvs/item0/_spdisplays_pixels", "3840 x 2400"},
           {"item0/spdisplays_ndrvs/item1/spdisplays_status", "spdisplays_not_connected"},
           {"item1/spdisplays_vram_shared", "1,5 GB of Shared System Memory"},
           {"item1/spdisplays_ndrvs/item0/_name", "Color LCD"},
           {"item1/spdisplays_ndrvs/item0/spdisplays_main", "spdisplays_no"},
           {"item1/spdisplays_ndrvs/item0/_spdisplays_resolution", "1512 x 982 @ 120.00Hz"},
           {"item1/spdisplays_ndrvs/item0/_spdisplays_pixels", "3024 x 1964"},
           {"item1/spdisplays_ndrvs/item1/_spdisplays_pixels", "3840 x 2160"},
           {"item2/spdisplays_vram", "0 MB"},
           {"item2/spdisplays_vram_shared", "1 GB"},
       })
    raw.setValue(std::string("/SPDisplaysDataType/_items/") + path, value);
  buildDisplaysSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Video")), R"tree(+Video=
+Video-devices=
Video-adapter:1=""
~complex=
Video-adapter:2=""
~complex=
Video-adapter:3=""
~complex=
*Video-adapter:1=
model="ATI Radeon HD 5770"
vendor=
video-memory=1024
~base-value=1073741824
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
*Video-adapter:3=
model=
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
Monitor:3=""
~complex=
*Monitor:1=
name="DELL U2410"
resolution="1920 x 1200"
main-display="1"
*Monitor:2=
name="Color LCD"
resolution="1512 x 982 @ 120.00Hz"
main-display="0"
*Monitor:3=
name=
resolution="3840 x 2160"
main-display="0"
-
-
)tree");
}

}  // namespace
}  // namespace cvn
