// Every recorded profiler document of real Macs goes through the whole scan
// after collection: parse, convert, quick facts, identity, all fifteen
// builders, the asset tree and the container, which the inspector must then
// read back. Runs only where the recordings are at hand.
#include <gtest/gtest.h>

#include "asset/asset_info.h"
#include "collect/file_system.h"
#include "collect/network_identity.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "collect/quick_facts.h"
#include "corpus_files.h"
#include "fake_command_runner.h"
#include "main/post_processor.h"
#include "qax_reader.h"
#include "zxml/QAXfile.h"

namespace cvn {
namespace {

class EmptyFileSystem : public FileSystem {
 public:
  std::vector<std::string> listDirectory(const std::string&) override { return {}; }
  bool isDirectory(const std::string&) override { return false; }
  bool readFile(const std::string&, size_t, std::string*) override { return false; }
};

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

    PlistValue plist;
    std::string warning;
    ASSERT_TRUE(parsePlist(text, &plist, &warning));
    EXPECT_EQ(warning, "") << "real profiler output must read without a problem";
    FakeCommandRunner runner;
    runner.answer("ls -1 /Users/", "jane\n");
    QuickFacts facts = readQuickFacts(plist, runner);
    TagTree raw(true, "Macintosh");
    PlistConverter(raw).convertPlist(plist);
    std::string ip;
    NetworkIdentity identity;
    readNetworkIdentity(plist, ip, &identity);

    TagTree snapshot(true, "Snapshot");
    EmptyFileSystem files;
    postProcess(snapshot, raw, false, runner, files, nullptr);
    snapshot.setValue("/timestamp", TagValue(SnapshotFile::makeTimestamp(true)));
    AssetIdentity asset;
    asset.ip = ip;
    asset.mac_address = identity.mac_address;
    std::unique_ptr<TagTree> asset_tree =
        buildAssetInfo(1, snapshot, "20131115213000.000000+0", facts, asset);

    SnapshotFile file(true);
    file.addTree(snapshot, kSnapshotBlock, false, true);
    file.addTree(*asset_tree, kAssetInfoBlock, false, true);
    std::vector<uint8_t> image = file.makeImage(true);
    QaxFile read_back;
    std::string read_error;
    ASSERT_TRUE(parseQaxImage(image.data(), image.size(), &read_back, &read_error)) << read_error;
    EXPECT_EQ(read_back.blocks.size(), 2u);
  }
  EXPECT_GT(documents, 20);
}

}  // namespace
}  // namespace cvn
