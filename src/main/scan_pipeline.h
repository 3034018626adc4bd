// The scan from the collected profiler document to the result file's image:
// parse, convert, quick facts and identity, the process list, the fifteen
// section builders, the asset tree and the container. The driver, the
// corpus test, the benchmark and the fuzz targets all run this one path.
#ifndef CVN_MAIN_SCAN_PIPELINE_H_
#define CVN_MAIN_SCAN_PIPELINE_H_

#include <cstdint>
#include <cstdio>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "zxml/tag.h"

namespace cvn {

class Clock;
class CommandRunner;
class FileSystem;
class ProcessTable;

/// What the scan reads the machine through; tests swap in fakes.
struct ScanSources {
  CommandRunner& runner;
  ProcessTable& processes;
  FileSystem& files;
  Clock& clock;
  std::function<std::string()> computer_name;
};

struct ScanRequest {
  /// The tree flag: byte order of every tree and of the container.
  bool native = true;
  /// The command line's address; empty means "find it".
  std::string ip;
  std::string login;
  /// When collecting began, for "/scan-time".
  int64_t start_time = 0;
  /// Receives the stage texts when given.
  std::FILE* log = nullptr;
};

struct ScanResult {
  /// The finished trees of a normal scan (the debug scan keeps neither).
  std::unique_ptr<TagTree> snapshot;
  std::unique_ptr<TagTree> asset_info;
  /// The result name's parts: the NetBIOS name (else the computer name) and
  /// the MAC address in dash form.
  std::string host;
  std::string mac_address;
  /// The whole result file.
  std::vector<uint8_t> image;
  /// The property-list reader's first complaint, if any.
  std::string parse_warning;
};

/// A normal scan of the spliced profiler document. `part_ends` (from the
/// collector) lets a broken data type cost only itself; it may be empty.
/// `extra_documents` are the collector's documents of the data types asked
/// for after the spliced ones; their data types join the list.
ScanResult runScanPipeline(std::string document, const std::vector<size_t>& part_ends,
                           const ScanRequest& request, const ScanSources& sources,
                           std::vector<std::string> extra_documents = {});

/// The debug scan: the profiler's whole output stored unparsed beside a
/// minimal asset tree.
ScanResult runDebugPipeline(const std::string& document, const ScanRequest& request,
                            const ScanSources& sources);

}  // namespace cvn

#endif  // CVN_MAIN_SCAN_PIPELINE_H_
