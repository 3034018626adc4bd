#include "collect/file_system.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <string>

namespace cvn {
namespace {

TEST(PosixFileSystemTest, ReadsAtMostTheBoundAndNeverBlocksOnAPipe) {
  char pattern[] = "/tmp/cvn_fs_XXXXXX";
  ASSERT_NE(mkdtemp(pattern), nullptr);
  const std::string dir = pattern, file = dir + "/a.txt", pipe = dir + "/pipe";
  std::ofstream(file) << "0123456789";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0644), 0);
  PosixFileSystem fs;
  std::string bytes;
  EXPECT_TRUE(fs.readFile(file, 4, &bytes));
  EXPECT_EQ(bytes, "0123");
  // Nobody writes to the pipe: opening it for reading must not wait.
  EXPECT_FALSE(fs.readFile(pipe, 1000, &bytes));
  EXPECT_EQ(bytes, "");
  unlink(file.c_str());
  unlink(pipe.c_str());
  rmdir(pattern);
}

}  // namespace
}  // namespace cvn
