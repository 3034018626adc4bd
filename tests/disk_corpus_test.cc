// Disk sizes from profiler outputs recorded on real Macs, each checked by eye
// against the recording. Without the recordings the test skips.
#include <string>

#include <gtest/gtest.h>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "sections/sections.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

// One line per disk: its name, size and byte count.
std::string diskSizes(const std::string& file) {
  PlistValue root;  // An unreadable recording shows as "no disks".
  parsePlist(readWholeFile(findCorpus() / "glpi-agent/resources/macos/system_profiler" / file),
             &root);
  TagTree raw(true, "Macintosh");
  PlistConverter(raw).convertPlist(root);
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  buildStorageSection(snapshot, raw);
  buildUsbSection(snapshot, raw, runner);
  const Tag* storage = snapshot.top().findChild("Storage");
  if (!storage) return "no disks";
  std::string out;
  for (const auto& disk : storage->firstChild()->children()) {
    const TagProperty* size = disk->findProperty("size");
    const Annotation* base = size ? size->findAnnotation("base-value") : nullptr;
    out += disk->name() + (size ? " " + size->value().textForm() : "") +
           (base ? " " + base->text : "") + "\n";
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

}  // namespace
}  // namespace cvn
