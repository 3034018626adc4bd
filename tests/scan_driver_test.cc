#include "main/scan_driver.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstdio>
#include <cstdlib>
#include <string>

namespace cvn {
namespace {

class ResultNameTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char tmpl[] = "/tmp/cvn-names-XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    dir_ = tmpl;
  }
  void TearDown() override { std::system(("rm -rf '" + dir_ + "'").c_str()); }
  void touch(const std::string& name) {
    std::FILE* f = std::fopen((dir_ + "/" + name).c_str(), "w");
    ASSERT_NE(f, nullptr);
    std::fclose(f);
  }
  std::string dir_;
};

TEST_F(ResultNameTest, CountsUpFromOneAndNeverOverwrites) {
  std::string path;
  EXPECT_EQ(chooseResultName(dir_, "janes-mbp", "00-1A-2B-3C-4D-5E", &path),
            "JANES-MBP_001A2B3C4D5E.qax");
  EXPECT_EQ(path, dir_ + "/JANES-MBP_001A2B3C4D5E.qax");
  touch("JANES-MBP_001A2B3C4D5E.qax");
  EXPECT_EQ(chooseResultName(dir_, "janes-mbp", "00-1A-2B-3C-4D-5E", &path),
            "JANES-MBP_001A2B3C4D5E(1).qax");
  touch("JANES-MBP_001A2B3C4D5E(1).qax");
  EXPECT_EQ(chooseResultName(dir_, "janes-mbp", "00-1A-2B-3C-4D-5E", &path),
            "JANES-MBP_001A2B3C4D5E(2).qax");
}

TEST_F(ResultNameTest, NoAddressKeepsTheSeparator) {
  std::string path;
  EXPECT_EQ(chooseResultName(dir_, "Mac", "", &path), "MAC_.qax");
}

}  // namespace
}  // namespace cvn
