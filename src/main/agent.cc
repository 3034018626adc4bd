#include "main/agent.h"

#include <cstdio>
#include <string>
#include <vector>

#include "collect/command_runner.h"
#include "collect/computer_name.h"
#include "collect/file_system.h"
#include "collect/process_table.h"
#include "main/clock.h"
#include "main/command_line.h"
#include "main/result_directory.h"
#include "main/scan_driver.h"

namespace cvn {

int runAgent(int argc, char** argv) {
  ScanSettings settings;
  std::vector<std::string> args;
  for (int i = 1; i < argc; ++i) args.emplace_back(argv[i]);
  auto go_silent = [] {
    // stdout stays: a calling tool reads the one result line from it.
    if (!std::freopen("/dev/null", "r", stdin)) std::clearerr(stdin);
    if (!std::freopen("/dev/null", "w", stderr)) std::clearerr(stderr);
  };
  if (parseCommandLine(args, &settings, go_silent) == CommandLineAction::kHelp) {
    printHelp(stdout);
    return 0;
  }
  if (!settings.silent) {
    switch (askConsent(stdin, stdout)) {
      case ConsentAnswer::kYes:
        break;
      case ConsentAnswer::kNo:
        return 0;
      case ConsentAnswer::kInvalid:
        return 1;
    }
  }
  OutputSettings output;
  output.progress_log = settings.log ? 1 : 0;

  std::unique_ptr<ProcessTable> processes = makeSystemProcessTable();
  SystemClock clock;
  WorkingDirectory directory;
  CommandRunner& runner = systemCommandRunner();
  runner.setLimits(ToolLimits::forProfilerSeconds(settings.profiler_timeout_seconds));
  if (settings.log) runner.setTimeoutLog(stdout);
  ScanSources sources{runner, *processes, systemFileSystem(), clock, readComputerName};
  ScanDriver driver(ScanTools{sources, directory, stdout, stderr});
  driver.run(output, settings);
  std::fflush(stdout);
  return 0;
}

}  // namespace cvn
