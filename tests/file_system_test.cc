#include "collect/file_system.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <string>

namespace cvn {
namespace {

TEST(PosixFileSystemTest, ListsSortedReadsAtMostTheBoundAndNeverBlocksOnAPipe) {
  char pattern[] = "/tmp/cvn_fs_XXXXXX";
  ASSERT_NE(mkdtemp(pattern), nullptr);
  const std::string dir = pattern, file = dir + "/a.txt", pipe = dir + "/pipe";
  const std::string text(20000, 'q');
  std::ofstream(file) << text;
  ASSERT_EQ(mkfifo(pipe.c_str(), 0644), 0);
  ASSERT_EQ(mkdir((dir + "/sub").c_str(), 0755), 0);
  PosixFileSystem fs;
  EXPECT_EQ(fs.listDirectory(dir), (std::vector<std::string>{"a.txt", "pipe", "sub"}));
  EXPECT_EQ(fs.listDirectory(dir + "/none"), std::vector<std::string>{});
  EXPECT_TRUE(fs.isDirectory(dir + "/sub"));
  EXPECT_FALSE(fs.isDirectory(file) || fs.isDirectory(dir + "/none"));
  std::string bytes;
  EXPECT_TRUE(fs.readFile(file, 4, &bytes));
  EXPECT_EQ(bytes, "qqqq");
  EXPECT_TRUE(fs.readFile(file, 1 << 20, &bytes));
  EXPECT_EQ(bytes, text);
  // Nobody writes to the pipe: opening it for reading must not wait.
  EXPECT_FALSE(fs.readFile(pipe, 1000, &bytes));
  EXPECT_EQ(bytes, "");
  std::filesystem::remove_all(dir);
}

}  // namespace
}  // namespace cvn
