// Disk sizes from profiler outputs recorded on real Macs, each checked by eye
// against the recording. Without the recordings the test skips.
#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

// One line per disk: its name, size and byte count.
std::string diskSizes(const std::string& file) {
  Plist root;  // An unreadable recording shows as "no disks".
  parsePlist(readWholeFile(findCorpus() / "glpi-agent/resources/macos/system_profiler" / file),
             &root);
  TagTree raw(true, "Macintosh");
  PlistConverter(raw).convertPlist(root);
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  buildUsbSection(snapshot, raw, runner, volumes);
  const Tag* storage = snapshot.top().findChild("Storage");
  if (!storage) return "no disks";
  std::string out;
  for (const auto& disk : storage->firstChild()->children()) {
    const TagProperty* size = disk->findProperty("size");
    const Annotation* base = size ? size->findAnnotation("base-value") : nullptr;
    out.append(disk->name());
    if (size) out += " " + size->value().textForm();
    if (base) out.append(" ").append(base->text);
    out += "\n";
  }
  return out;
}

TEST(DiskCorpusTest, DiskSizes) {
  if (findCorpus().empty()) GTEST_SKIP() << "no recorded outputs";
  EXPECT_EQ(diskSizes("SPSerialATADataType.xml"), "HDD:1 250 250059350016\n");
  // The removable size is read from the text as binary gigabytes, so a
  // profiler that prints decimal units ("500.11 GB") gives 537.
  EXPECT_EQ(diskSizes("SPUSBDataType.xml"), "Removable:1 537 500107859968\n");
  // A 10.6 profiler with letter-prefixed keys and no byte counts.
  EXPECT_EQ(diskSizes("SPUSBDataType2.xml"), "Removable:1 8\nRemovable:2 500\nRemovable:3 2\n");
}

// The whole Storage section of a recording, as text.
std::string storageText(const std::filesystem::path& file) {
  Plist root;
  parsePlist(readWholeFile(findCorpus() / file), &root);
  TagTree raw(true, "Macintosh");
  PlistConverter(raw).convertPlist(root);
  TagTree snapshot(true, "Snapshot");
  WrittenVolumes volumes;
  buildStorageSection(snapshot, raw, volumes);
  return treeText(snapshot.top().findChild("Storage"));
}

TEST(DiskCorpusTest, TodaysDiskTypes) {
  if (findCorpus().empty()) GTEST_SKIP() << "no recorded outputs";
  // An Apple Silicon Mac of 2026: only APFS containers, none of them a volume.
  EXPECT_EQ(storageText("glpi-agent/resources/macos/system_profiler/SPNVMeDataType.xml"),
            R"(+Storage=
+Physical-disks=
*HDD:1=
model="APPLE SSD AP0512Q"
interface="NVMe"
mediatype=3
~type=media-type
size=500
~base-value=500277792768
serial="0ba016ebe08d5c1d"
fw-rev="561.100."
partitions=0
-
-
)");
  // A 2016 Intel Mac's mounted volume, on CoreStorage, with byte counts only.
  EXPECT_EQ(storageText("ohai/test-data/unit/plugins/darwin/"
                        "hardware_system_profiler_output.rb.d/"
                        "HardwareSystemProfilerOutput_Storage.xml"),
            R"(+Storage=
+Logical-disks=
*partition:1="Macintosh HD"
file-sys="Journaled HFS+"
size=249.66
~base-value=249661751296
free=23.86
~base-value=23864803328
mount-point="/"
used%=90
~pos=225.80
~max=249.66
~val-units=GB
-
-
)");
}

}  // namespace
}  // namespace cvn
