#include "main/panic_log.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>

namespace cvn {
namespace {

class PanicLogTest : public ::testing::Test {
 protected:
  void SetUp() override {
    char cwd[4096];
    ASSERT_NE(getcwd(cwd, sizeof cwd), nullptr);
    old_cwd_ = cwd;
    std::string dir = ::testing::TempDir() + "/panic_log_XXXXXX";
    ASSERT_NE(mkdtemp(&dir[0]), nullptr);
    dir_ = dir;
    ASSERT_EQ(chdir(dir_.c_str()), 0);
  }
  void TearDown() override {
    std::remove("panic.log");
    ASSERT_EQ(chdir(old_cwd_.c_str()), 0);
    rmdir(dir_.c_str());
  }
  // The log with every time field's digits replaced by "T".
  static std::string readLog() {
    std::ifstream in("panic.log");
    std::stringstream s;
    s << in.rdbuf();
    std::string log = s.str();
    for (size_t at = log.find("Time: "); at != std::string::npos; at = log.find("Time: ", at)) {
      at += 6;
      size_t end = log.find_first_not_of("0123456789", at);
      if (end == at) break;
      log.replace(at, end - at, "T");
    }
    return log;
  }
  std::string old_cwd_, dir_;
};

TEST_F(PanicLogTest, AppendsOneLinePerCallAndReportsOnStderr) {
  ::testing::internal::CaptureStderr();
  PanicLog::reportPanic("scan.cc", 42, 7, ENOENT, "no profiler");
  std::string err = ::testing::internal::GetCapturedStderr();
  EXPECT_EQ(
      err,
      "Error at Line: 42;\nErrnum: 2;\nFile name: scan.cc;\nMessage: no profiler;\n Code: 7;\n");
  ::testing::internal::CaptureStderr();
  PanicLog::reportPanic("main.cc", 9, -1, 0, nullptr);
  EXPECT_EQ(::testing::internal::GetCapturedStderr(),
            "Error at Line: 9;\nErrnum: 0;\nFile name: main.cc;\nMessage: ;\n Code: -1;\n");
  EXPECT_EQ(readLog(),
            "PANIC EXIT. Application: cvnmacagent, Time: T, File: scan.cc, Line: 42, Code: #7, "
            "Error: #2 (No such file or directory), Message: \"no profiler\"\n"
            "PANIC EXIT. Application: cvnmacagent, Time: T, File: main.cc, Line: 9, Code: #-1, "
            "Error: #0 (" +
                std::string(std::strerror(0)) + "), Message: \"\"\n");
}

TEST_F(PanicLogTest, UnopenableLogStillReportsOnStderr) {
  ASSERT_EQ(mkdir("panic.log", 0700), 0);  // a directory cannot be opened for appending
  ::testing::internal::CaptureStderr();
  int written = PanicLog::reportPanic("x.cc", 1, 2, 3, "m");
  std::string err = ::testing::internal::GetCapturedStderr();
  EXPECT_EQ(written, static_cast<int>(err.size()));
  EXPECT_EQ(err, "Error at Line: 1;\nErrnum: 3;\nFile name: x.cc;\nMessage: m;\n Code: 2;\n");
  rmdir("panic.log");
}

}  // namespace
}  // namespace cvn
