// Runs the hardware builders over recorded profiler outputs of real Macs when
// the recordings are at hand, for the facts an administrator checks by eye.
#include <gtest/gtest.h>

#include <string>

#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "sections/sections.h"
#include "tree_text.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

TEST(HardwareSectionsCorpusTest, ModelSerialAndMemoryOfThreeMacs) {
  const std::filesystem::path corpus = findCorpus();
  if (corpus.empty()) GTEST_SKIP() << "no recorded profiler outputs at hand";
  const std::string ohai = "ohai/test-data/unit/plugins/darwin/";
  // Each: the recording, then the model, serial and memory lines it must give.
  const std::string machines[][4] = {
      {ohai + "system_profiler_output.rb.d/SystemProfilerOutput_Full.xml",
       "model=\"MacBookPro8,2\"", "serial=\"ABCDEFG12345\"", "physical-memory=8192\n"},
      {"grr/grr/test/grr_response_test/test_data/system_profiler.xml", "model=\"MacBookPro10,1\"",
       "serial=\"C02JQ0F5F6L9\"", "physical-memory=16384\n"},
      {ohai + "hardware_system_profiler_output.rb.d/HardwareSystemProfilerOutput_Hardware.xml",
       "model=\"MacBookPro11,1\"", "serial=\"ABCDEFG12345\"", "physical-memory=16384\n"},
  };
  for (const auto& machine : machines) {
    Plist value;
    ASSERT_TRUE(parsePlist(readWholeFile(corpus / machine[0]), &value)) << machine[0];
    TagTree raw(true, "Macintosh"), snapshot(true, "Snapshot");
    PlistConverter(raw).convertPlist(value);
    buildSystemSection(snapshot, raw, "ioreg's");
    buildMemorySection(snapshot, raw);
    const std::string text = treeText(&snapshot.top());
    for (int i = 1; i < 4; ++i) EXPECT_NE(text.find(machine[i]), std::string::npos) << machine[i];
    EXPECT_EQ(text.find("ioreg's"), std::string::npos);  // every one has its UUID
  }
}

}  // namespace
}  // namespace cvn
