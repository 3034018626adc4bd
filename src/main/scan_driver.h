// Runs one scan from start to finish: collect, parse, convert, build the
// sections and the asset tree, and save them under a name that never
// overwrites an earlier result.
#ifndef CVN_MAIN_SCAN_DRIVER_H_
#define CVN_MAIN_SCAN_DRIVER_H_

#include <cstdio>
#include <functional>
#include <string>

#include "main/scan_settings.h"

namespace cvn {

class CommandRunner;
class FileSystem;
class ProcessTable;

/// What the scan reads the machine through; tests swap in fakes.
struct ScanTools {
  CommandRunner& runner;
  ProcessTable& processes;
  FileSystem& files;
  std::function<std::string()> computer_name;
  std::FILE* out = stdout;
  std::FILE* err = stderr;
};

/// "HOST_ADDR.qax" in `directory`, or "HOST_ADDR(N).qax" for the first N
/// from 1 that is free. The host part is upper-cased, the dashes leave the
/// address. Returns the bare file name; `full_path` gets directory/name.
std::string chooseResultName(const std::string& directory, const std::string& host,
                             const std::string& mac_address, std::string* full_path);

class ScanDriver {
 public:
  explicit ScanDriver(ScanTools tools) : tools_(std::move(tools)) {}

  /// `ip` is the command line's address; empty means "find it".
  void run(const OutputSettings& output, bool silent, bool debug, std::string ip,
           const std::string& login);

 private:
  void runNormal(const OutputSettings& output, bool silent, std::string ip,
                 const std::string& login);
  void runDebug(const OutputSettings& output, bool silent, std::string ip,
                const std::string& login);
  void log(bool enabled, const char* text);
  /// Stages VI and VII and the report line.
  void saveAndReport(class SnapshotFile& file, const OutputSettings& output, bool silent,
                     const std::string& host, const std::string& mac_address);

  ScanTools tools_;
};

}  // namespace cvn

#endif  // CVN_MAIN_SCAN_DRIVER_H_
