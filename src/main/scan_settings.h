// What the command line decides, filled once before the scan and only read
// afterwards.
#ifndef CVN_MAIN_SCAN_SETTINGS_H_
#define CVN_MAIN_SCAN_SETTINGS_H_

#include <cstdint>
#include <string>

namespace cvn {

struct ScanSettings {
  bool silent = false;
  bool debug = false;
  bool log = false;
  /// "-ip:"; empty means "find it". The scan fills it in when empty.
  std::string ip;
  /// "-login:"; handed on to the asset section.
  std::string login;
  /// "-timeout:"; the profiler's limit, and the others' when shorter.
  int64_t profiler_timeout_seconds = 300;
  bool scan_requested = false;
};

/// The three one-byte flags handed to the scan driver.
struct OutputSettings {
  /// Byte order flag for every tree and for the container (1: native).
  uint8_t tree_flag = 1;
  /// When set the driver returns at once.
  uint8_t abort_flag = 0;
  /// Print the stage messages.
  uint8_t progress_log = 0;
};

}  // namespace cvn

#endif  // CVN_MAIN_SCAN_SETTINGS_H_
