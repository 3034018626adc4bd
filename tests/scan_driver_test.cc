// The whole driver in-process, on fakes: the sample Mac's recorded profiler
// outputs, a clock that ticks, and a result directory held in memory that
// can refuse to write.
#include "main/scan_driver.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <set>

#include "corpus_files.h"
#include "fake_scan_sources.h"
#include "qax_reader.h"

namespace cvn {
namespace {

const std::string kProfiler = "system_profiler -detailLevel full -xml";

// Answers the profiler from the sample Mac's recordings, the rest from the table.
class SampleMacRunner : public FakeCommandRunner {
 public:
  ToolOutput respond(const std::string& command) override {
    if (command.compare(0, kProfiler.size(), kProfiler) != 0)
      return FakeCommandRunner::respond(command);
    std::string type = command.size() > kProfiler.size() ? command.substr(kProfiler.size() + 1)
                                                         : std::string("full");
    return {readWholeFile(CVN_SOURCE_DIR "/tests/sample_mac/profiler/" + type + ".xml"), false};
  }
};

class MemoryDirectory : public ResultDirectory {
 public:
  std::string path() override { return "/results"; }
  bool isTaken(const std::string& full_path) override { return files.count(full_path) != 0; }
  SaveOutcome writeFile(const std::string& full_path, const std::vector<uint8_t>& image) override {
    if (refuse_writes) return SaveOutcome::kFailed;
    // Another program creates these names between the probe and the save.
    if (raced.erase(full_path)) {
      files[full_path] = {};
      return SaveOutcome::kNameTaken;
    }
    files[full_path] = image;
    return SaveOutcome::kSaved;
  }
  std::map<std::string, std::vector<uint8_t>> files;
  std::set<std::string> raced;
  bool refuse_writes = false;
};

// Captures what the driver prints on one stream.
class Capture {
 public:
  Capture() : file_(open_memstream(&buffer_, &size_)) {}
  ~Capture() {
    std::fclose(file_);
    std::free(buffer_);
  }
  std::FILE* file() { return file_; }
  std::string text() {
    std::fflush(file_);
    return std::string(buffer_, size_);
  }

 private:
  char* buffer_ = nullptr;
  size_t size_ = 0;
  std::FILE* file_;
};

class ScanDriverTest : public ::testing::Test {
 protected:
  void runScan(bool debug, bool silent, bool log) {
    OutputSettings output;
    output.progress_log = log ? 1 : 0;
    ScanSettings options;
    options.debug = debug;
    options.silent = silent;
    ScanSources sources{runner_, fakes_.processes, fakes_.files, fakes_.clock,
                        [] { return std::string("Jane's MacBook"); }};
    ScanDriver(ScanTools{sources, directory_, out_.file(), err_.file()}).run(output, options);
  }

  QaxFile readResult(const std::string& path) {
    QaxFile file;
    std::string error;
    const std::vector<uint8_t>& image = directory_.files[path];
    EXPECT_TRUE(parseQaxImage(image.data(), image.size(), &file, &error)) << error;
    return file;
  }

  SampleMacRunner runner_;
  FakeScanSources fakes_;
  MemoryDirectory directory_;
  Capture out_;
  Capture err_;
};

TEST_F(ScanDriverTest, NormalScanWritesTheSnapshotUnderAFreeName) {
  runner_.answer("ls -1 /Users/", "jane\n");
  directory_.files["/results/JANE-MBP_0026BB5C3A91.qax"] = {};
  directory_.raced = {"/results/JANE-MBP_0026BB5C3A91(1).qax"};
  directory_.files["/results/JANE-MBP_0026BB5C3A91(2).qax"] = {};
  fakes_.processes.entries = {{1, 0, "launchd"}};
  runner_.answer("ps -axww -o pid= -o user= -o command=", "    1 root     /sbin/launchd\n");
  runScan(false, false, true);

  const std::string path = "/results/JANE-MBP_0026BB5C3A91(3).qax";
  EXPECT_EQ(out_.text().substr(0, 45), "------Start Log------\nI. Collecting Data....\n");
  EXPECT_NE(out_.text().find("VII. Saving to file....done\n------End Log------\n\nScan finished. "
                             "Results saved to file \"" +
                             path + "\"\n"),
            std::string::npos);
  EXPECT_EQ(err_.text(), "");
  QaxFile file = readResult(path);
  ASSERT_EQ(file.blocks.size(), 2u);
  const QaxTree& snapshot = file.blocks[0].tree;
  // The clock moves one second at each look: start, end of the sections.
  EXPECT_EQ(snapshot.findProperty("", "scan-time")->value, "1000");
  EXPECT_EQ(snapshot.findProperty("", "hostname")->value, "Jane-MBP");
  EXPECT_EQ(snapshot.findProperty("", "ip-address")->value, "192.168.1.23");
  const QaxProperty* command = snapshot.findProperty("/Processes/process:1", "cmd-line");
  ASSERT_NE(command, nullptr);
  EXPECT_EQ(command->value, "/sbin/launchd");
  const QaxTree& asset = file.blocks[1].tree;
  EXPECT_EQ(asset.findProperty("", "int-name")->value, "Jane's MacBook");
  EXPECT_EQ(std::count_if(runner_.commands_ran_.begin(), runner_.commands_ran_.end(),
                          [](const std::string& c) { return c.rfind("ioreg ", 0) == 0; }),
            1)
      << "the asset summary and the System section share one reading";
}

TEST_F(ScanDriverTest, DebugScanStoresTheWholeProfilerOutput) {
  runScan(true, true, true);
  EXPECT_EQ(out_.text(), ">>>JANE-MBP_0026BB5C3A91.qax\n");
  QaxFile file = readResult("/results/JANE-MBP_0026BB5C3A91.qax");
  ASSERT_EQ(file.blocks.size(), 2u);
  EXPECT_EQ(file.blocks[0].type, "assetinfo");
  EXPECT_EQ(file.blocks[1].data,
            readWholeFile(CVN_SOURCE_DIR "/tests/sample_mac/profiler/full.xml"));
  EXPECT_EQ(runner_.commands_ran_, std::vector<std::string>{kProfiler});
}

TEST_F(ScanDriverTest, AFailedWriteIsReportedOnStderrOnly) {
  runner_.answer("ls -1 /Users/", "jane\n");
  directory_.refuse_writes = true;
  runScan(false, true, false);
  EXPECT_EQ(out_.text(), "");
  EXPECT_EQ(err_.text(), "Cannot create file :/results/JANE-MBP_0026BB5C3A91.qax\n");
  EXPECT_TRUE(directory_.files.empty());
}

}  // namespace
}  // namespace cvn
