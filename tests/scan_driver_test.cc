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

const std::string kProfiler = "system_profiler -detailLevel full -xml ";

// Answers the profiler from the sample Mac's recordings, the rest from the table.
class SampleMacRunner : public FakeCommandRunner {
 public:
  ToolOutput respond(const std::string& command) override {
    if (command.compare(0, kProfiler.size(), kProfiler) != 0)
      return FakeCommandRunner::respond(command);
    return {readWholeFile(CVN_SOURCE_DIR "/tests/sample_mac/profiler/" +
                          command.substr(kProfiler.size()) + ".xml"),
            false};
  }
};

class MemoryDirectory : public ResultDirectory {
 public:
  std::string path() override { return "/results"; }
  bool isTaken(const std::string& full_path) override { return files.count(full_path) != 0; }
  SaveOutcome writeFile(const std::string& full_path, const std::vector<uint8_t>& image) override {
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
};

// What was printed on `file`.
std::string printed(std::FILE* file) {
  std::string text(static_cast<size_t>(std::ftell(file)), '\0');
  std::rewind(file);
  text.resize(std::fread(&text[0], 1, text.size(), file));
  return text;
}

// The driver in-process: a name taken between the probe and the save is
// passed over, and the clock and the sources are the fakes'.
TEST(ScanDriverTest, NormalScanWritesTheSnapshotUnderAFreeName) {
  SampleMacRunner runner;
  runner.answer("ls -1 /Users/", "jane\n");
  runner.answer("ps -axww -o pid= -o user= -o command=", "    1 root     /sbin/launchd\n");
  FakeScanSources fakes;
  fakes.processes.entries = {{1, 0, "launchd"}};
  MemoryDirectory directory;
  directory.files["/results/JANE-MBP_0026BB5C3A91.qax"] = {};
  directory.raced = {"/results/JANE-MBP_0026BB5C3A91(1).qax"};
  directory.files["/results/JANE-MBP_0026BB5C3A91(2).qax"] = {};
  std::FILE* out = std::tmpfile();
  std::FILE* err = std::tmpfile();
  OutputSettings output;
  output.progress_log = 1;
  ScanSources sources{runner, fakes.processes, fakes.files, fakes.clock,
                      [] { return std::string("Jane's MacBook"); }};
  ScanDriver(ScanTools{sources, directory, out, err}).run(output, ScanSettings());

  const std::string path = "/results/JANE-MBP_0026BB5C3A91(3).qax";
  const std::string said = printed(out);
  EXPECT_EQ(said.substr(0, 45), "------Start Log------\nI. Collecting Data....\n");
  EXPECT_NE(said.find("VII. Saving to file....done\n------End Log------\n\nScan finished. "
                      "Results saved to file \"" +
                      path + "\"\n"),
            std::string::npos);
  EXPECT_EQ(printed(err), "");
  std::fclose(out);
  std::fclose(err);
  QaxFile file;
  std::string error;
  const std::vector<uint8_t>& image = directory.files[path];
  ASSERT_TRUE(parseQaxImage(image.data(), image.size(), &file, &error)) << error;
  ASSERT_EQ(file.blocks.size(), 2u);
  const QaxTree& snapshot = file.blocks[0].tree;
  // The clock moves one second at each look: start, end of the sections.
  EXPECT_EQ(snapshot.findProperty("", "scan-time")->value, "1000");
  const QaxProperty* command = snapshot.findProperty("/Processes/process:1", "cmd-line");
  ASSERT_NE(command, nullptr);
  EXPECT_EQ(command->value, "/sbin/launchd");
  EXPECT_EQ(file.blocks[1].tree.findProperty("", "int-name")->value, "Jane's MacBook");
  EXPECT_EQ(std::count_if(runner.commands_ran_.begin(), runner.commands_ran_.end(),
                          [](const std::string& c) { return c.rfind("ioreg ", 0) == 0; }),
            1)
      << "the asset summary and the System section share one reading";
}

}  // namespace
}  // namespace cvn
