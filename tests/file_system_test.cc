#include "collect/file_system.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <string>

namespace cvn {
namespace {

class PosixFileSystemTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char pattern[] = "/tmp/cvn_fs_XXXXXX";
    ASSERT_NE(mkdtemp(pattern), nullptr);
    dir_ = pattern;
    ASSERT_EQ(mkdir((dir_ + "/b folder").c_str(), 0755), 0);
    std::ofstream(dir_ + "/a.txt") << "0123456789";
    ASSERT_EQ(mkfifo((dir_ + "/pipe").c_str(), 0644), 0);
  }
  void TearDown() override {
    unlink((dir_ + "/a.txt").c_str());
    unlink((dir_ + "/pipe").c_str());
    rmdir((dir_ + "/b folder").c_str());
    rmdir(dir_.c_str());
  }

  std::string dir_;
  PosixFileSystem fs_;
};

TEST_F(PosixFileSystemTest, ListsSortedEntriesAndTellsFoldersApart) {
  EXPECT_EQ(fs_.listDirectory(dir_), (std::vector<std::string>{"a.txt", "b folder", "pipe"}));
  EXPECT_TRUE(fs_.listDirectory(dir_ + "/missing").empty());
  EXPECT_TRUE(fs_.listDirectory(dir_ + "/a.txt").empty());
  EXPECT_TRUE(fs_.isDirectory(dir_ + "/b folder"));
  EXPECT_FALSE(fs_.isDirectory(dir_ + "/a.txt"));
  EXPECT_FALSE(fs_.isDirectory(dir_ + "/missing"));
}

TEST_F(PosixFileSystemTest, ReadsAtMostTheBoundAndNeverBlocksOnAPipe) {
  std::string bytes;
  EXPECT_TRUE(fs_.readFile(dir_ + "/a.txt", 4, &bytes));
  EXPECT_EQ(bytes, "0123");
  EXPECT_TRUE(fs_.readFile(dir_ + "/a.txt", 1000, &bytes));
  EXPECT_EQ(bytes, "0123456789");
  EXPECT_FALSE(fs_.readFile(dir_ + "/missing", 1000, &bytes));
  EXPECT_FALSE(fs_.readFile(dir_ + "/b folder", 1000, &bytes));
  EXPECT_FALSE(fs_.readFile(dir_ + "/pipe", 1000, &bytes));
  EXPECT_EQ(bytes, "");
}

}  // namespace
}  // namespace cvn
