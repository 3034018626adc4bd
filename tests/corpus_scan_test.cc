// Runs the agent's code over the recorded profiler outputs of real Macs, when
// the recordings are at hand: every document through the whole scan, and the
// facts an administrator checks by eye against a recording.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "fake_scan_sources.h"
#include "main/scan_pipeline.h"
#include "qax_reader.h"
#include "sections/builder_util.h"
#include "sections/edid.h"
#include "sections/sections.h"
#include "sections/written_volumes.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

/// The raw tree of a recording; an unreadable one gives an empty tree.
TagTree rawTreeOf(const std::filesystem::path& file) {
  Plist root;
  parsePlist(readWholeFile(findCorpus() / file), &root);
  TagTree raw(true, "Macintosh");
  PlistConverter(raw).convertPlist(root);
  return raw;
}

TEST(CorpusScanTest, EveryRecordedMacGivesAReadableResultFileAndItsMonitors) {
  std::filesystem::path root = findCorpus();
  if (root.empty()) GTEST_SKIP() << "no recorded outputs beside the sources";
  int documents = 0, with_displays = 0;
  std::error_code error;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(root, error)) {
    std::string text = entry.is_regular_file() ? readWholeFile(entry.path()) : "";
    if (!isPlistText(text)) continue;
    ++documents;
    SCOPED_TRACE(entry.path().string());
    FakeScanSources fakes;
    fakes.runner.answer("ls -1 /Users/", "jane\n");
    ScanResult result = runScanPipeline(text, {}, ScanRequest(), fakes.sources());
    EXPECT_EQ(result.parse_warning, "") << "real profiler output must read without a problem";
    QaxFile read_back;
    std::string read_error;
    ASSERT_TRUE(parseQaxImage(result.image.data(), result.image.size(), &read_back, &read_error))
        << read_error;
    EXPECT_EQ(read_back.blocks.size(), 2u);

    // Every connected display is a monitor, and the decoded EDID agrees
    // with the profiler's own reading of it.
    TagTree raw = rawTreeOf(entry.path());
    const Tag* items = findItems(raw, "SPDisplaysDataType");
    if (!items || items->children().empty()) continue;
    ++with_displays;
    TagTree snapshot(true, "Snapshot");
    buildDisplaysSection(snapshot, raw);
    const Tag* video = snapshot.top().findChild("Video");
    const Tag* monitors = video ? video->findChild("Monitors") : nullptr;
    ASSERT_NE(monitors, nullptr);
    size_t connected = 0;
    for (const auto& item : items->children()) {
      const Tag* displays = item->findChild("spdisplays_ndrvs");
      for (size_t i = 0; displays && i < displays->children().size(); ++i) {
        const Tag& display = *displays->children()[i];
        if (rawText(display, "spdisplays_status") != "spdisplays_not_connected") ++connected;
        std::string year(rawText(display, "_spdisplays_display-year"));
        EdidInfo info;
        if (!decodeEdidText(rawText(display, "_spdisplays_edid"), &info) || year.empty()) continue;
        EXPECT_EQ(info.week + " " + info.year,
                  std::string(rawText(display, "_spdisplays_display-week")) + " " + year);
      }
    }
    EXPECT_EQ(monitors->children().size(), connected);
  }
  EXPECT_GT(documents, 20);
  EXPECT_GT(with_displays, 0);
}

// One line per disk: its name, size and byte count.
std::string diskSizes(const std::string& file) {
  TagTree raw = rawTreeOf("glpi-agent/resources/macos/system_profiler/" + file);
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

TEST(CorpusScanTest, DiskSizes) {
  if (findCorpus().empty()) GTEST_SKIP() << "no recorded outputs";
  EXPECT_EQ(diskSizes("SPSerialATADataType.xml"), "HDD:1 250 250059350016\n");
  // The removable size is read from the text as binary gigabytes, so a
  // profiler that prints decimal units ("500.11 GB") gives 537.
  EXPECT_EQ(diskSizes("SPUSBDataType.xml"), "Removable:1 537 500107859968\n");
  // A 10.6 profiler with letter-prefixed keys and no byte counts.
  EXPECT_EQ(diskSizes("SPUSBDataType2.xml"), "Removable:1 8\nRemovable:2 500\nRemovable:3 2\n");
  // An Apple Silicon Mac of 2026: only APFS containers, none of them a volume.
  EXPECT_EQ(diskSizes("SPNVMeDataType.xml"), "HDD:1 500 500277792768\n");
}

}  // namespace
}  // namespace cvn
