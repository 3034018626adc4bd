// What the cases in section_cases/ cannot write out: nesting deeper than
// any real tree, and sizes in megabytes read on their own.
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "fake_command_runner.h"
#include "sections/builder_util.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

/// The snapshot that the storage and then the USB builder write from `keys`.
std::string buildDisks(const std::vector<std::pair<std::string, TagValue>>& keys) {
  TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
  for (const auto& [path, value] : keys) raw.setValue("/" + path, value);
  FakeCommandRunner runner;
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  buildUsbSection(snapshot, raw, runner, volumes);
  return treeText(&snapshot.top());
}

// Real trees nest a handful of hubs; a damaged one may nest without end.
TEST(UsbSectionTest, WalksNestedHubsUpToABound) {
  for (const char* items :
       {"SPUSBDataType/_items/item0/_items/", "SPUSBHostDataType/_items/item0/_items/"}) {
    std::vector<std::pair<std::string, TagValue>> keys;
    std::string path = items;
    for (int depth = 0; depth < 200; ++depth) {
      if (depth == 5) keys.push_back({path + "item1/_name", "Keyboard"});
      path += "item0/_items/";
    }
    keys.push_back({path + "item0/_name", "Too deep"});
    EXPECT_EQ(buildDisks(keys),
              "+Snapshot=\n+Peripherals=\n+USB=\n*Device:1=\"Keyboard\"\n-\n-\n-\n")
        << items;
  }
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
