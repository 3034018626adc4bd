// Runs one scan from start to finish: collect, hand the document to the scan
// pipeline, and save the result under a name that never overwrites an
// earlier one.
#ifndef CVN_MAIN_SCAN_DRIVER_H_
#define CVN_MAIN_SCAN_DRIVER_H_

#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "main/scan_pipeline.h"
#include "main/scan_settings.h"

namespace cvn {

class ResultDirectory;

/// Everything the driver reaches the machine through; tests swap in fakes.
struct ScanTools {
  ScanSources sources;
  ResultDirectory& directory;
  std::FILE* out = stdout;
  std::FILE* err = stderr;
};

class ScanDriver {
 public:
  explicit ScanDriver(ScanTools tools) : tools_(std::move(tools)) {}

  /// One scan as the command line asked for it; the output record's flags
  /// decide the byte order, whether to go on at all, and the stage texts.
  void run(const OutputSettings& output, const ScanSettings& settings);

 private:
  void log(bool enabled, const char* text);
  /// Stages VI and VII and the report line.
  void saveAndReport(const std::vector<uint8_t>& image, bool logging, bool silent,
                     const std::string& host, const std::string& mac_address);

  ScanTools tools_;
};

}  // namespace cvn

#endif  // CVN_MAIN_SCAN_DRIVER_H_
