#include "main/scan_driver.h"

#include <climits>

#include "collect/command_runner.h"
#include "collect/profiler_collector.h"
#include "main/clock.h"
#include "main/result_directory.h"
#include "main/result_name.h"

namespace cvn {
namespace {

// The first name from "HOST_ADDR.qax", "HOST_ADDR(1).qax", ... from
// `counter` on that nothing bears; the last counter is used even if taken.
int nextFreeCounter(ResultDirectory& directory, const std::string& folder,
                    const ResultName& result_name, int counter) {
  while (counter < INT_MAX && directory.isTaken(folder + "/" + result_name.fileName(counter)))
    ++counter;
  return counter;
}

}  // namespace

void ScanDriver::log(bool enabled, const char* text) {
  if (!enabled) return;
  std::fputs(text, tools_.out);
  std::fflush(tools_.out);
}

void ScanDriver::run(const OutputSettings& output, const ScanSettings& options) {
  if (output.abort_flag) return;
  const bool logging = output.progress_log != 0;
  ScanRequest request;
  request.native = output.tree_flag != 0;
  request.ip = options.ip;
  request.login = options.login;
  ScanResult result;
  if (options.debug) {
    // Asked again while it prints nothing, like the collector; one that hit
    // its limit is not, and what it printed is kept for support to see.
    CommandRunner& runner = tools_.sources.runner;
    ToolOutput document;
    do {
      runner.start(0, "system_profiler -detailLevel full -xml", 65536, runner.limits().profiler);
      int id = 0;
      if (!runner.waitForOne(&id, &document)) break;
    } while (document.text.empty() && !document.timed_out);
    result = runDebugPipeline(document.text, request, tools_.sources);
    // The debug scan prints no stage texts.
    saveAndReport(result.image, false, options.silent, result.host, result.mac_address);
    return;
  }

  request.start_time = tools_.sources.clock.now();
  request.log = logging ? tools_.out : nullptr;
  log(logging, "------Start Log------\n");
  log(logging, "I. Collecting Data....\n");
  std::vector<size_t> part_ends;
  ProfilerCollector collector(tools_.sources.runner);
  std::vector<std::string> extra_documents;
  std::string document = collector.collect(logging, tools_.out, &part_ends, &extra_documents);
  log(logging, "done\n");
  result = runScanPipeline(std::move(document), part_ends, request, tools_.sources,
                           std::move(extra_documents));
  // The trees are done with once the image exists.
  result.snapshot.reset();
  result.asset_info.reset();
  saveAndReport(result.image, logging, options.silent, result.host, result.mac_address);
}

void ScanDriver::saveAndReport(const std::vector<uint8_t>& image, bool logging, bool silent,
                               const std::string& host, const std::string& mac_address) {
  log(logging, "VI. Generating File name....");
  const std::string folder = tools_.directory.path();
  const ResultName result_name = makeResultName(host, mac_address);
  int counter = nextFreeCounter(tools_.directory, folder, result_name, 0);
  log(logging, "done\n");
  log(logging, "VII. Saving to file....");
  std::string name = result_name.fileName(counter);
  std::string full_path = folder + "/" + name;
  SaveOutcome outcome = tools_.directory.writeFile(full_path, image);
  // Something took the name since the probe: on to the next free one.
  while (outcome == SaveOutcome::kNameTaken && counter < INT_MAX) {
    counter = nextFreeCounter(tools_.directory, folder, result_name, counter + 1);
    name = result_name.fileName(counter);
    full_path = folder + "/" + name;
    outcome = tools_.directory.writeFile(full_path, image);
  }
  const bool saved = outcome == SaveOutcome::kSaved;
  log(logging, "done\n");
  log(logging, "------End Log------\n");
  if (!saved) {
    std::fprintf(tools_.err, "Cannot create file :%s\n", full_path.c_str());
  } else if (silent) {
    std::fprintf(tools_.out, ">>>%s\n", name.c_str());
  } else {
    std::fprintf(tools_.out, "\nScan finished. Results saved to file \"%s\"\n", full_path.c_str());
  }
  std::fflush(tools_.out);
}

}  // namespace cvn
