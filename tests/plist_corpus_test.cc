// Runs the reader and the converter over recorded profiler outputs when a
// folder of them is at hand.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "collect/network_identity.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "corpus_files.h"
#include "plist_path_reference.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(PlistCorpusTest, RecordedOutputsParseAndConvert) {
  std::filesystem::path root = findCorpus();
  if (root.empty()) GTEST_SKIP() << "no recorded outputs beside the sources";
  std::error_code error;
  int files = 0;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(root, error)) {
    if (!entry.is_regular_file()) continue;
    std::ifstream in(entry.path(), std::ios::binary);
    std::ostringstream bytes;
    bytes << in.rdbuf();
    std::string text = bytes.str();
    if (text.compare(0, 5, "<?xml") != 0 || text.find("<plist") == std::string::npos) continue;
    ++files;
    PlistValue value;
    std::string warning;
    ASSERT_TRUE(parsePlist(text, &value, &warning)) << entry.path();
    EXPECT_EQ(warning, "") << entry.path();
    TagTree by_cursor(true, "Macintosh");
    PlistConverter(by_cursor).convertPlist(value);
    TagTree by_path(true, "Macintosh");
    reference::convertPlist(by_path, value);
    EXPECT_EQ(treeText(&by_cursor.document()), treeText(&by_path.document())) << entry.path();
    EXPECT_FALSE(by_cursor.top().children().empty()) << entry.path();
    std::string ip;
    NetworkIdentity identity;
    readNetworkIdentity(value, ip, &identity);
  }
  EXPECT_GT(files, 0);
}

}  // namespace
}  // namespace cvn
