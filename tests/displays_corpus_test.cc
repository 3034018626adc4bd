// Builds the Video section from every recorded profiler document that holds
// display data, and checks the decoded EDID against what the profiler itself
// says about the same monitor.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "sections/builder_util.h"
#include "sections/edid.h"
#include "sections/sections.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

std::string fieldText(const Tag& record, std::string_view field) {
  const TagProperty* p = record.findProperty(field);
  return p ? p->value().textForm() : "<missing>";
}

// The profiler's own reading of the EDID, where it gives one.
void checkAgainstProfiler(const Tag& monitor, const Tag& display, const std::string& where) {
  std::vector<uint8_t> edid = edidBytesFromText(rawText(display, "_spdisplays_edid"));
  if (edid.empty()) return;
  if (hasKey(display, "_spdisplays_display-vendor-id")) {
    EXPECT_EQ(formatText("%x", edid[8] << 8 | edid[9]),
              rawText(display, "_spdisplays_display-vendor-id"))
        << where;
  }
  if (hasKey(display, "_spdisplays_display-product-id")) {
    EXPECT_EQ(formatText("%x", edid[11] << 8 | edid[10]),
              rawText(display, "_spdisplays_display-product-id"))
        << where;
  }
  if (hasKey(display, "_spdisplays_display-week")) {
    EXPECT_EQ(fieldText(monitor, "manuf-week"), rawText(display, "_spdisplays_display-week"))
        << where;
  }
  if (hasKey(display, "_spdisplays_display-year")) {
    EXPECT_EQ(fieldText(monitor, "manuf-year"), rawText(display, "_spdisplays_display-year"))
        << where;
  }
  EXPECT_EQ(fieldText(monitor, "manufacturer").size(), 3u) << where;
}

TEST(DisplaysCorpusTest, RecordedDisplayDataBuildsTheVideoSection) {
  std::filesystem::path root = findCorpus();
  if (root.empty()) GTEST_SKIP() << "no corpus beside the sources";
  int documents = 0;
  std::error_code error;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(root, error)) {
    if (!entry.is_regular_file()) continue;
    std::ifstream in(entry.path(), std::ios::binary);
    std::ostringstream bytes;
    bytes << in.rdbuf();
    std::string text = bytes.str();
    if (text.compare(0, 5, "<?xml") != 0 || text.find("SPDisplaysDataType") == std::string::npos)
      continue;
    PlistValue value;
    if (!parsePlist(text, &value)) continue;
    TagTree raw(true, "Macintosh");
    PlistConverter(raw).convertPlist(value);
    const Tag* items = findItems(raw, "SPDisplaysDataType");
    if (!items || items->children().empty()) continue;
    ++documents;
    std::string where = entry.path().string();

    TagTree snapshot(true, "Snapshot");
    buildDisplaysSection(snapshot, raw);
    const Tag* video = snapshot.top().findChild("Video");
    ASSERT_NE(video, nullptr) << where;
    const Tag* devices = video->findChild("Video-devices");
    const Tag* monitors = video->findChild("Monitors");
    ASSERT_NE(devices, nullptr) << where;
    ASSERT_NE(monitors, nullptr) << where;
    EXPECT_EQ(devices->children().size(), items->children().size()) << where;

    size_t monitor = 0;
    for (const auto& item : items->children()) {
      const Tag* displays = item->findChild("spdisplays_ndrvs");
      if (!displays) continue;
      for (const auto& display : displays->children()) {
        if (rawText(*display, "spdisplays_status") == "spdisplays_not_connected") continue;
        ASSERT_LT(monitor, monitors->children().size()) << where;
        const Tag& record = *monitors->children()[monitor++];
        EXPECT_EQ(fieldText(record, "name"), rawText(*display, "_name")) << where;
        checkAgainstProfiler(record, *display, where + " " + record.name());
      }
    }
    EXPECT_EQ(monitors->children().size(), monitor) << where;
  }
  EXPECT_GT(documents, 0);
}

}  // namespace
}  // namespace cvn
