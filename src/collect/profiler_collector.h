// Runs system_profiler once per data type and splices the outputs into one
// property-list document whose root array holds one dictionary per type.
#ifndef CVN_COLLECT_PROFILER_COLLECTOR_H_
#define CVN_COLLECT_PROFILER_COLLECTOR_H_

#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "collect/command_runner.h"

namespace cvn {

/// The profiler's own document header (172 bytes) and footer (18 bytes).
extern const std::string_view kProfilerHeader;
extern const std::string_view kProfilerFooter;

class ProfilerCollector {
 public:
  /// Which ends of one tool output are cut before splicing.
  enum class Trim { kMiddle = 0, kFirst = 1, kLast = 2 };

  explicit ProfilerCollector(CommandRunner& runner) : runner_(runner) {}

  /// The spliced document. With `progress` the percentages go to `out`.
  /// `part_ends`, when given, receives the end offset of every piece
  /// appended (one per step that added something).
  std::string collect(bool progress, std::FILE* out, std::vector<size_t>* part_ends = nullptr);

  /// One data type's output, cut by byte count; empty when it is too short
  /// for the cut. A tool that prints nothing is asked again until it does.
  std::string runProfiler(std::string_view data_type, Trim trim);

  /// The data types where today's Macs keep their NVMe disks, mounted APFS
  /// volumes and (from macOS 26) USB tree, each run once after the others
  /// and kept as a whole document of its own, so that the spliced document
  /// stays as it was. Prints nothing; a type the profiler does not know
  /// gives no document.
  std::vector<std::string> collectExtraTypes();

 private:
  CommandRunner& runner_;
};

class Plist;

/// Parses the spliced document as one property list. When that reports a
/// problem (one data type's output was malformed or broke off), each data
/// type's piece is read on its own instead, so one bad piece costs only its
/// own data type, not every one after it. Returns false when nothing could
/// be read. `warning`, when given, receives the whole document's first
/// problem.
bool parseCollectedDocument(std::string_view document, const std::vector<size_t>& part_ends,
                            Plist* out, std::string* warning = nullptr);

/// Appends to the profiler list `root` the data type dictionaries of the
/// documents of collectExtraTypes, each only when it is one of the types
/// asked for there and `root` does not hold that type yet. Unreadable documents
/// are passed over.
void addExtraTypes(const std::vector<std::string>& documents, Plist* root);

}  // namespace cvn

#endif  // CVN_COLLECT_PROFILER_COLLECTOR_H_
