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

  /// At most `side_by_side` profiler runs at a time.
  explicit ProfilerCollector(CommandRunner& runner, size_t side_by_side = 6)
      : runner_(runner), side_by_side_(side_by_side == 0 ? 1 : side_by_side) {}

  /// The spliced document, the same bytes whatever order the runs end in.
  /// With `progress` the percentages, and a line for each run that hit its
  /// limit, go to `out`. `part_ends`, when given, receives the end offset of
  /// every piece appended (one per step that added something).
  /// `extra_documents`, when given, receives the whole outputs of the data
  /// types where today's Macs keep their NVMe disks, mounted APFS volumes
  /// and (from macOS 26) USB tree, run alongside: each is asked once, since
  /// a Mac that lacks them is normal, and kept apart, so that the spliced
  /// document stays what the older Macs give.
  std::string collect(bool progress, std::FILE* out, std::vector<size_t>* part_ends = nullptr,
                      std::vector<std::string>* extra_documents = nullptr);

 private:
  CommandRunner& runner_;
  size_t side_by_side_;
};

/// One data type's output, cut by byte count; empty when it is too short
/// for the cut.
std::string trimProfilerOutput(std::string output, ProfilerCollector::Trim trim);

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
