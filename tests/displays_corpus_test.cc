// Builds the Video section from every recorded profiler document with display
// data, and checks the decoded EDID against the profiler's own reading of it.
#include <gtest/gtest.h>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "sections/builder_util.h"
#include "sections/edid.h"
#include "sections/sections.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(DisplaysCorpusTest, RecordedDisplayDataBuildsTheVideoSection) {
  std::filesystem::path root = findCorpus();
  if (root.empty()) GTEST_SKIP() << "no corpus beside the sources";
  int documents = 0;
  std::error_code error;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(root, error)) {
    std::string text = entry.is_regular_file() ? readWholeFile(entry.path()) : "";
    Plist value;
    if (!isPlistText(text) || text.find("SPDisplaysDataType") == std::string::npos ||
        !parsePlist(text, &value))
      continue;
    TagTree raw(true, "Macintosh");
    PlistConverter(raw).convertPlist(value);
    TagTree snapshot(true, "Snapshot");
    buildDisplaysSection(snapshot, raw);
    const Tag* items = findItems(raw, "SPDisplaysDataType");
    if (!items || items->children().empty()) continue;
    ++documents;
    const Tag* video = snapshot.top().findChild("Video");
    const Tag* monitors = video ? video->findChild("Monitors") : nullptr;
    ASSERT_NE(monitors, nullptr) << entry.path();
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
    EXPECT_EQ(monitors->children().size(), connected) << entry.path();
  }
  EXPECT_GT(documents, 0);
}

}  // namespace
}  // namespace cvn
