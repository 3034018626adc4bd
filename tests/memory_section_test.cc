#include <gtest/gtest.h>

#include <cstdint>
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

std::string buildMemory(const TagTree& raw) {
  TagTree snapshot(true, "Snapshot");
  buildMemorySection(snapshot, raw);
  return treeText(snapshot.top().findChild("Memory"));
}

// Records are counted, not numbered by raw position; a nested slot always gets
// "manuf", a flat one only when the profiler names the maker; only "ok" is
// used; the speed is the text before the first blank. The hardware overview
// alone still gives the general info.
TEST(MemorySectionTest, SlotsAndGeneralInfo) {
  TagTree raw(true, "Macintosh");
  const std::string bank = "/SPMemoryDataType/_items/item0/_items/item1/";
  raw.setValue(bank + "_name", "BANK 0/DIMM0");
  raw.setValue(bank + "dimm_size", "4 GB");
  raw.setValue(bank + "dimm_speed", "1067 MHz");
  raw.setValue(bank + "dimm_status", "ok");
  raw.setValue(bank + "dimm_type", "DDR3");
  raw.setValue("/SPMemoryDataType/_items/item3/dimm_status", "OK");
  raw.setValue("/SPMemoryDataType/_items/item3/dimm_speed", " 667 MHz");
  raw.setValue("/SPHardwareDataType/_items/item0/physical_memory", "2 TB");
  EXPECT_EQ(buildMemory(raw), R"txt(+Memory=
*Memory-slot:1=
used="1"
manuf=
capacity=4096
mem-type="DDR3"
speed="1067"
bank-label="BANK 0/DIMM0"
*Memory-slot:2=
used="0"
capacity=0
mem-type=
speed=""
bank-label=
*General-info=
physical-memory=2048000
-
)txt");
  TagTree hardware_only(true, "Macintosh");
  hardware_only.setValue("/SPHardwareDataType/_items/item0/physical_memory", "4 GB");
  EXPECT_EQ(buildMemory(hardware_only), "+Memory=\n*General-info=\nphysical-memory=4096\n-\n");
}

TEST(MemorySectionTest, SizeInMegabytesAtItsBoundaries) {
  // A decimal comma reads as a point; the result is truncated, not rounded;
  // units are case-sensitive; sizes beyond float (which must not even be
  // narrowed) or beyond int64 as megabytes give 0.
  const struct {
    const char* text;
    int64_t megabytes;
  } cases[] = {{"", 0},        {"nan GB", 0},    {"1024 KB", 1},
               {"1023 KB", 0}, {"1,5 GB", 1536}, {"3.999 GB", 4094},
               {"4 gb", 0},    {"1e300 TB", 0},  {"9e15 GB", 0}};
  for (const auto& c : cases) EXPECT_EQ(sizeInMegabytes(c.text), c.megabytes) << c.text;
}

}  // namespace
}  // namespace cvn
