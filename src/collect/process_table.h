// The kernel's process table, behind an interface: sysctl on macOS, /proc on
// Linux.
#ifndef CVN_COLLECT_PROCESS_TABLE_H_
#define CVN_COLLECT_PROCESS_TABLE_H_

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace cvn {

class CommandRunner;
class TagTree;

struct ProcessEntry {
  int64_t pid = 0;
  int64_t ppid = 0;
  /// The kernel's short command name (at most 16 bytes on macOS).
  std::string short_name;
};

class ProcessTable {
 public:
  virtual ~ProcessTable() = default;
  /// The table in kernel order (entries with pid 0 included). False when the
  /// table cannot be read at all.
  virtual bool read(std::vector<ProcessEntry>* entries) = 0;
};

/// The table of the machine we run on.
std::unique_ptr<ProcessTable> makeSystemProcessTable();

/// Fills "Processes" under the raw tree's top tag: "process:N" (N = table
/// position + 1) with pid, ppid and, from `ps`, user and command line. A
/// process that `ps` no longer knows is left out.
void collectProcesses(TagTree& raw, ProcessTable& table, CommandRunner& runner);

}  // namespace cvn

#endif  // CVN_COLLECT_PROCESS_TABLE_H_
