#include "main/scan_driver.h"

#include <cctype>
#include <climits>

#include "collect/command_runner.h"
#include "collect/profiler_collector.h"
#include "main/result_directory.h"

namespace cvn {
namespace {

// "HOST_ADDR.qax", or "HOST_ADDR(N).qax" for the first N from 1 that is
// free. The host part is upper-cased, the dashes leave the address. Returns
// the bare file name; `full_path` gets directory/name.
std::string chooseResultName(ResultDirectory& directory, const std::string& host,
                             const std::string& mac_address, std::string* full_path) {
  std::string host_part;
  for (char c : host) host_part += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  std::string address_part;
  for (char c : mac_address)
    if (c != '-') address_part += c;
  const std::string folder = directory.path();
  std::string name = host_part + "_" + address_part + ".qax";
  *full_path = folder + "/" + name;
  for (int counter = 1; directory.isTaken(*full_path) && counter < INT_MAX; ++counter) {
    name = host_part + "_" + address_part + "(" + std::to_string(counter) + ").qax";
    *full_path = folder + "/" + name;
  }
  return name;
}

}  // namespace

void ScanDriver::log(bool enabled, const char* text) {
  if (!enabled) return;
  std::fputs(text, tools_.out);
  std::fflush(tools_.out);
}

void ScanDriver::run(const OutputSettings& output, const ScanOptions& options) {
  if (output.abort_flag) return;
  const bool logging = output.progress_log != 0;
  ScanRequest request;
  request.native = output.tree_flag != 0;
  request.ip = options.ip;
  request.login = options.login;
  ScanResult result;
  if (options.debug) {
    // Deliberately unbounded, like the collector: a profiler that never
    // answers keeps the debug scan waiting.
    std::string document;
    do {
      document = tools_.sources.runner.run("system_profiler -detailLevel full -xml", 65536);
    } while (document.empty());
    result = runDebugPipeline(document, request, tools_.sources);
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
  std::string document = collector.collect(logging, tools_.out, &part_ends);
  std::vector<std::string> extra_documents = collector.collectExtraTypes();
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
  std::string full_path;
  std::string name = chooseResultName(tools_.directory, host, mac_address, &full_path);
  log(logging, "done\n");
  log(logging, "VII. Saving to file....");
  bool saved = tools_.directory.writeFile(full_path, image);
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
