// Fakes for everything a scan reads the machine through, bundled: a command
// runner that answers from a table, an empty process table and file system,
// and a clock that moves one second at every look.
#ifndef CVN_TESTS_FAKE_SCAN_SOURCES_H_
#define CVN_TESTS_FAKE_SCAN_SOURCES_H_

#include <string>
#include <vector>

#include "collect/process_table.h"
#include "fake_command_runner.h"
#include "fake_file_system.h"
#include "main/clock.h"
#include "main/result_directory.h"
#include "main/scan_pipeline.h"

namespace cvn {

class FixedProcessTable : public ProcessTable {
 public:
  bool read(std::vector<ProcessEntry>* out) override {
    *out = entries;
    return readable;
  }
  std::vector<ProcessEntry> entries;
  bool readable = true;
};

class SteppingClock : public Clock {
 public:
  int64_t now() override { return time++; }
  /// 2013-11-15 21:30:00 UTC.
  int64_t time = 1384551000;
};

struct FakeScanSources {
  FakeCommandRunner runner;
  FixedProcessTable processes;
  FakeFileSystem files;
  SteppingClock clock;
  std::string computer_name = "Jane's MacBook";

  ScanSources sources() {
    return ScanSources{runner, processes, files, clock, [this] { return computer_name; }};
  }
};

}  // namespace cvn

#endif  // CVN_TESTS_FAKE_SCAN_SOURCES_H_
