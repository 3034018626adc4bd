// The quick facts of today's Macs, read from small profiler lists: the asset
// summary must say what the sections say.
#include "collect/quick_facts.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "collect/processor_text.h"

namespace cvn {
namespace {

// A profiler list with one dictionary per data type; `items` is the XML of
// the "_items" array's elements.
std::string profilerList(const std::vector<std::pair<std::string, std::string>>& types) {
  std::string xml = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\"><array>";
  for (const auto& [type, items] : types) {
    xml += "<dict><key>_dataType</key><string>" + type + "</string><key>_items</key><array>" +
           items + "</array></dict>";
  }
  return xml + "</array></plist>\n";
}

// Every field that comes from the profiler list, one per line, empty ones too.
std::string factsText(const std::string& list) {
  Plist root;
  EXPECT_TRUE(parsePlist(list, &root));
  QuickFacts f = readQuickFacts(root, "");  // ioreg printed nothing
  return "packages=" + f.package_count + "\ncores=" + f.processor_count +
         "\nspeed=" + f.processor_speed + "\nmodel=" + f.processor_model +
         "\nmaker=" + f.processor_maker + "\nmemory=" + f.physical_memory +
         "\nvram=" + f.video_memory + "\nresolution=" + f.main_display_resolution +
         "\nedid=" + f.main_display_edid + "\ndisks=" + f.disk_capacity +
         "\nvolumes=" + f.volume_capacity + "\nfree=" + f.volume_free + "\n";
}

// Forms the sample Macs do not show, by the facts they give.
TEST(QuickFactsTest, OlderAndOddForms) {
  const std::string display =
      "<dict><key>sppci_model</key><string>Apple M3 Pro</string><key>spdisplays_ndrvs</key>"
      "<array><dict><key>_name</key><string>LG</string><key>_spdisplays_resolution</key>"
      "<string>3840 x 2160 @ 60.00Hz</string></dict><dict><key>spdisplays_main</key>"
      "<string>spdisplays_yes</string>";
  const std::string sata =
      "<dict><key>_items</key><array><dict><key>size</key><string>500,11 GB</string>"
      "<key>volumes</key><array><dict><key>size</key><string>400 GB</string>"
      "<key>free_space</key><string>100 GB</string></dict></array></dict></array></dict>";
  const std::string nvme =
      "<dict><key>_items</key><array><dict><key>size</key><string>1 TB</string>"
      "<key>volumes</key><array><dict><key>size</key><string>994.66 GB</string></dict>"
      "</array></dict></array></dict>";
  const struct {
    std::vector<std::pair<std::string, std::string>> types;
    std::string expected;  // a run of lines of factsText
  } cases[] = {
      {{{"SPHardwareDataType",
         "<dict><key>cpu_type</key><string>Quad-Core Intel Core i7</string>"
         "<key>current_processor_speed</key><string>2,01 GHz</string><key>number_processors</key>"
         "<integer>4</integer><key>packages</key><integer>1</integer></dict>"}},
       "packages=1\ncores=4\nspeed=2010\nmodel=Quad-Core Intel Core i7\nmaker=GenuineIntel\n"},
      // A text count that is not Apple Silicon's is passed on as it is;
      // without a chip nothing invents a package count.
      {{{"SPHardwareDataType",
         "<dict><key>cpu_type</key><string>PowerPC G4</string><key>current_processor_speed</key>"
         "<string>867 MHz</string><key>number_processors</key><string>2</string></dict>"}},
       "packages=\ncores=2\nspeed=867\nmodel=PowerPC G4\nmaker=\n"},
      // Apple's virtual machines count cores as an integer; a package
      // count in a text is no count.
      {{{"SPHardwareDataType",
         "<dict><key>chip_type</key><string>Apple M4 Max (Virtual)</string><key>number_processors"
         "</key><integer>4</integer><key>packages</key><string>1</string></dict>"}},
       "packages=\ncores=4\nspeed=\nmodel=Apple M4 Max (Virtual)\nmaker=Apple Inc.\n"},
      // The main display of today; the older key wins, even when it says nothing.
      {{{"SPDisplaysDataType",
         display +
             "<key>_spdisplays_resolution</key><string>1512 x 982 @ 120.00Hz</string>"
             "<key>_spdisplays_pixels</key><string>3024 x 1964</string></dict></array></dict>"}},
       "vram=\nresolution=1512 x 982 @ 120.00Hz\nedid=\n"},
      {{{"SPDisplaysDataType", display + "<key>_spdisplays_pixels</key><string>3024 x 1964</string>"
                                         "</dict></array></dict>"}},
       "vram=\nresolution=3024 x 1964\nedid=\n"},
      {{{"SPDisplaysDataType",
         display + "<key>spdisplays_resolution</key><string></string><key>_spdisplays_resolution"
                   "</key><string>1512 x 982 @ 120.00Hz</string></dict></array></dict>"}},
       "vram=\nresolution=\nedid=\n"},
      // NVMe disks count, but not their containers.
      {{{"SPSerialATADataType", sata}, {"SPNVMeDataType", nvme}},
       "disks=1500.1\nvolumes=400.0\nfree=100.0\n"},
      // An NVMe disk alone tells nothing of the volumes.
      {{{"SPNVMeDataType", nvme}}, "disks=1000.0\nvolumes=\nfree=\n"},
  };
  for (const auto& c : cases) {
    std::string text = factsText(profilerList(c.types));
    EXPECT_NE(text.find(c.expected), std::string::npos) << text;
  }
}

// The summary and the Processors section read the speed through this.
TEST(QuickFactsTest, ClockSpeedIsRoundedToTheNearestMegahertz) {
  const std::pair<const char*, int64_t> cases[] = {
      {"2.01 GHz", 2010}, {"2.0096 GHz", 2010}, {"2.0094 GHz", 2009}, {"867 MHz", 867},
      {"3 GHz", 3000},    {"GHz", 0},           {"-1 GHz", 0},        {"nan GHz", 0}};
  for (const auto& [text, megahertz] : cases) EXPECT_EQ(megahertzOfSpeedText(text), megahertz);
}

}  // namespace
}  // namespace cvn
