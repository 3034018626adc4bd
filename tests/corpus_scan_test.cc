// Every recorded profiler document of real Macs goes through the whole scan
// after collection: parse, convert, quick facts, identity, all fifteen
// builders, the asset tree and the container, which the inspector must then
// read back. Runs only where the recordings are at hand.
#include <gtest/gtest.h>

#include "corpus_files.h"
#include "fake_command_runner.h"
#include "fake_file_system.h"
#include "fake_scan_sources.h"
#include "main/scan_pipeline.h"
#include "qax_reader.h"

namespace cvn {
namespace {

TEST(CorpusScanTest, EveryRecordedMacGivesAReadableResultFile) {
  std::filesystem::path root = findCorpus();
  if (root.empty()) GTEST_SKIP() << "no recorded outputs beside the sources";
  int documents = 0;
  std::error_code error;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(root, error)) {
    if (!entry.is_regular_file()) continue;
    std::string text = readWholeFile(entry.path());
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
  }
  EXPECT_GT(documents, 20);
}

}  // namespace
}  // namespace cvn
