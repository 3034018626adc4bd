// The disk and USB builders against profiler outputs recorded on real Macs.
// The recordings live outside the repository; without them the tests skip.
#include <cstdlib>
#include <fstream>
#include <sstream>
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

std::string corpusDir() { return findCorpus().string(); }

bool readRecording(const std::string& relative_path, TagTree& raw) {
  std::ifstream in(corpusDir() + "/" + relative_path, std::ios::binary);
  if (!in) return false;
  std::stringstream text;
  text << in.rdbuf();
  PlistValue root;
  if (!parsePlist(text.str(), &root)) return false;
  PlistConverter(raw).convertPlist(root);
  return true;
}

// One line per disk: its name, the size and byte count, and its volume count.
std::string diskSummary(const TagTree& snapshot) {
  const Tag* storage = snapshot.top().findChild("Storage");
  const Tag* disks = storage ? storage->findChild("Physical-disks") : nullptr;
  if (!disks) return "";
  std::string out;
  for (const auto& disk : disks->children()) {
    out += disk->name();
    if (const TagProperty* size = disk->findProperty("size")) {
      out += " " + size->value().textForm();
      if (const Annotation* base = size->findAnnotation("base-value")) out += " " + base->text;
    }
    if (const TagProperty* partitions = disk->findProperty("partitions")) {
      out += " partitions=" + partitions->value().textForm();
    }
    out += "\n";
  }
  return out;
}

std::string deviceCount(const TagTree& snapshot) {
  const Tag* peripherals = snapshot.top().findChild("Peripherals");
  const Tag* usb = peripherals ? peripherals->findChild("USB") : nullptr;
  return "devices=" + std::to_string(usb ? usb->children().size() : 0);
}

std::string summariseRecording(const std::string& file) {
  TagTree raw(true, "Macintosh");
  if (!readRecording("glpi-agent/resources/macos/system_profiler/" + file, raw)) return "";
  TagTree snapshot(true, "Snapshot");
  FakeCommandRunner runner;
  buildStorageSection(snapshot, raw);
  buildUsbSection(snapshot, raw, runner);
  return diskSummary(snapshot) + deviceCount(snapshot);
}

class DiskCorpusTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (findCorpus().empty()) GTEST_SKIP() << "no recorded outputs at " << corpusDir();
  }
};

TEST_F(DiskCorpusTest, SerialAtaDisks) {
  // 250,06 GB drive with EFI, Macintosh HD and Recovery HD.
  EXPECT_EQ(summariseRecording("SPSerialATADataType.xml"),
            "HDD:1 250 250059350016 partitions=3\ndevices=0");
  EXPECT_EQ(summariseRecording("SPSerialATADataType2.xml"),
            "HDD:1 121 121332826112 partitions=3\ndevices=0");
  // A virtual machine: one disk, one CD drive, and 28 empty controllers.
  EXPECT_EQ(summariseRecording("SPSerialATADataType3.xml"),
            "HDD:1 41 41943040000 partitions=2\nCD:1\ndevices=0");
}

TEST_F(DiskCorpusTest, UsbDevicesAndRemovableDisks) {
  // The removable size is read from the text as binary gigabytes, so a
  // profiler that prints decimal units ("500.11 GB") gives 537.
  EXPECT_EQ(summariseRecording("SPUSBDataType.xml"),
            "Removable:1 537 500107859968 partitions=3\ndevices=5");
  // A 10.6 profiler with letter-prefixed keys and no byte counts.
  EXPECT_EQ(summariseRecording("SPUSBDataType2.xml"),
            "Removable:1 8 partitions=1\nRemovable:2 500 partitions=3\n"
            "Removable:3 2 partitions=0\ndevices=5");
  EXPECT_EQ(summariseRecording("SPUSBDataType3.xml"),
            "Removable:1 500 partitions=3\nRemovable:2 2 partitions=0\n"
            "Removable:3 8 partitions=1\nRemovable:4 4 partitions=0\n"
            "Removable:5 4 partitions=1\ndevices=6");
  EXPECT_EQ(summariseRecording("SPUSBDataType4.xml"), "devices=2");
  EXPECT_EQ(summariseRecording("SPUSBDataType_with_inserted_dvd.xml"),
            "Removable:1 17 15931539456 partitions=1\n"
            "Removable:2 1 392647584 partitions=1\ndevices=1");
  EXPECT_EQ(summariseRecording("SPUSBDataType_without_inserted_dvd.xml"), "devices=3");
}

TEST_F(DiskCorpusTest, OtherDataTypesLeaveNoDisks) {
  for (const char* file :
       {"ohai/test-data/unit/plugins/darwin/hardware_system_profiler_output.rb.d/"
        "HardwareSystemProfilerOutput_Storage.xml",
        "ohai/test-data/unit/plugins/darwin/system_profiler_output.rb.d/"
        "SystemProfilerOutput_Full.xml"}) {
    TagTree raw(true, "Macintosh");
    ASSERT_TRUE(readRecording(file, raw)) << file;
    ASSERT_NE(raw.top().firstChild(), nullptr) << file;
    TagTree snapshot(true, "Snapshot");
    FakeCommandRunner runner;
    buildStorageSection(snapshot, raw);
    buildUsbSection(snapshot, raw, runner);
    EXPECT_EQ(snapshot.top().firstChild(), nullptr) << file;
  }
}

}  // namespace
}  // namespace cvn
