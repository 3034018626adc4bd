#include "main/panic_log.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>

namespace cvn {
namespace {

TEST(PanicLogTest, StderrReportAndLogLine) {
  char cwd[4096];
  ASSERT_NE(getcwd(cwd, sizeof cwd), nullptr);
  std::string dir = ::testing::TempDir() + "/panic_log_XXXXXX";
  ASSERT_NE(mkdtemp(&dir[0]), nullptr);
  ASSERT_EQ(chdir(dir.c_str()), 0);
  EXPECT_EQ(mkdir("panic.log", 0700), 0);  // unopenable at first: stderr still gets the report
  for (int run = 0; run < 3; ++run) {
    if (run == 1) rmdir("panic.log");
    ::testing::internal::CaptureStderr();
    PanicLog::reportPanic("scan.cc", 42, 7, 2, run == 2 ? nullptr : "no profiler");
    EXPECT_EQ(::testing::internal::GetCapturedStderr(),
              "Error at Line: 42;\nErrnum: 2;\nFile name: scan.cc;\nMessage: " +
                  std::string(run == 2 ? "" : "no profiler") + ";\n Code: 7;\n");
  }
  std::ifstream in("panic.log");
  std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  for (size_t at = text.find("Time: "); at != std::string::npos; at = text.find("Time: ", at + 6))
    text.replace(at + 6, text.find(',', at) - at - 6, "T");
  const std::string line =
      "PANIC EXIT. Application: cvnmacagent, Time: T, File: scan.cc, Line: 42, Code: #7, "
      "Error: #2 (No such file or directory), Message: \"";
  EXPECT_EQ(text, line + "no profiler\"\n" + line + "\"\n");
  std::remove("panic.log");
  ASSERT_EQ(chdir(cwd), 0);
  rmdir(dir.c_str());
}

}  // namespace
}  // namespace cvn
