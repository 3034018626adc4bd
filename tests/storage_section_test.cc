// What the cases in section_cases/ cannot write out: sizes read back as
// numbers, and nesting deeper than any real tree.
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

const std::string kSata = "SPSerialATADataType/_items/item0/_items/";

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

// Disk size "<gigabytes>/<bytes>" and the volume's used share, from odd inputs.
TEST(StorageSectionTest, SizeRoundingAndUsedShare) {
  const struct {
    const char *disk_key, *disk_size, *volume_size, *volume_free, *expected;
  } cases[] = {
      // 0.40 decimal gigabytes stays 0, 0.41 counts up to 1.
      {"size", "390625 KB", nullptr, nullptr, "0/400000000 -"},
      {"size", "400390,625 KB", nullptr, nullptr, "1/410000000 -"},
      {"size", "1e300 TB", nullptr, nullptr, "0/0 -"},
      {"size_in_bytes", "500107862016", nullptr, nullptr, "0/0 -"},
      {"size", nullptr, "30 GB", "3,35 GB", "- 88"},
      {"size", nullptr, "1 GB", "Zero KB", "- 100"},
      {"size", nullptr, "nan GB", "1 GB", "- -"},
  };
  for (const auto& c : cases) {
    TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
    const std::string disk = "/" + kSata + "item0/";
    raw.setValue(disk + "smart_status", "Verified");
    raw.setValue(disk + "volumes/item0/_name", "V");
    if (c.disk_size) raw.setValue(disk + c.disk_key, c.disk_size);
    if (c.volume_size) raw.setValue(disk + "volumes/item0/size", c.volume_size);
    if (c.volume_free) raw.setValue(disk + "volumes/item0/free_space", c.volume_free);
    WrittenVolumes volumes;
    buildStorageSection(snapshot, raw, volumes);
    const Tag* storage = snapshot.top().findChild("Storage");
    const TagProperty* size = storage->firstChild()->firstChild()->findProperty("size");
    const TagProperty* used =
        storage->findChild("Logical-disks")->firstChild()->findProperty("used%");
    std::string text = size ? size->value().textForm() + "/" +
                                  std::string(size->findAnnotation("base-value")->text)
                            : "-";
    EXPECT_EQ(text + " " + (used ? used->value().textForm() : "-"), c.expected) << c.expected;
  }
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
