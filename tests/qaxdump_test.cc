#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdio>
#include <string>

#include "zxml/QAXfile.h"
#include "zxml/tag.h"

namespace cvn {
namespace {

struct RunResult {
  int status;
  std::string out;
};

// Runs qaxdump with stderr folded into the captured output.
RunResult runQaxdump(const std::string& args) {
  std::string command = std::string(CVN_BINARY_DIR) + "/qaxdump " + args + " 2>&1";
  RunResult result{-1, ""};
  FILE* pipe = popen(command.c_str(), "r");
  if (!pipe) return result;
  char buf[4096];
  size_t n;
  while ((n = std::fread(buf, 1, sizeof buf, pipe)) > 0) result.out.append(buf, n);
  int status = pclose(pipe);
  result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return result;
}

TEST(QaxdumpTest, ChecksDumpsAndRejects) {
  std::string path = ::testing::TempDir() + "/qaxdump_test.qax";
  TagTree asset(true, "AssetInfo");
  asset.setValue("/control/os", TagValue("Mac OS X"));
  SnapshotFile file(true);
  file.addTree(asset, kAssetInfoBlock, false, true);
  ASSERT_TRUE(file.save(path, true));

  RunResult check = runQaxdump("--check " + path);
  EXPECT_EQ(check.status, 0);
  EXPECT_EQ(check.out, "ok\n");

  RunResult dump = runQaxdump(path);
  EXPECT_EQ(dump.status, 0);
  EXPECT_NE(dump.out.find("\n== block 0: type=assetinfo offset=0 length="), std::string::npos);
  EXPECT_NE(dump.out.find("\xEF\xBB\xBF?zxml\n+AssetInfo=\n+control=\nos=Mac OS X\n-\n-\n"),
            std::string::npos)
      << dump.out;

  RunResult json = runQaxdump("--json " + path);
  EXPECT_EQ(json.status, 0);
  EXPECT_NE(json.out.find("\"name\": \"control\""), std::string::npos) << json.out;

  FILE* f = std::fopen(path.c_str(), "r+b");
  ASSERT_NE(f, nullptr);
  std::fseek(f, -1, SEEK_END);
  std::fputc('?', f);
  std::fclose(f);
  RunResult bad = runQaxdump("--check " + path);
  EXPECT_EQ(bad.status, 1);
  EXPECT_EQ(bad.out, "qaxdump: " + path + ": no \"QAX!\" magic in the last 4 bytes\n");
  std::remove(path.c_str());

  EXPECT_EQ(runQaxdump("--json").status, 2);
}

}  // namespace
}  // namespace cvn
