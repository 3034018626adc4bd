// What changed between two results of one Mac: records added and removed,
// fields changed, grouped by section. Records are paired by name, and an
// application whose name changed with its version is paired with its old
// self, so an upgrade reads as one change.
#ifndef CVN_TOOLS_QAX_DIFF_H_
#define CVN_TOOLS_QAX_DIFF_H_

#include <string>
#include <vector>

#include "qax_reader.h"

namespace cvn {

struct QaxChange {
  enum class Kind { kAdded, kRemoved, kChanged };
  /// What the change is about: a whole record (added, removed, or renamed:
  /// old and new are its names), the record's own value, or one field.
  enum class Subject { kRecord, kValue, kField };

  std::string section;  // "Memory", "Peripherals/USB"; a group's own fields: its parent
  std::string record;   // "Memory-slot:1", "Monitor:2/h-freq"; a renamed record's new name
  Kind kind = Kind::kChanged;
  Subject subject = Subject::kField;
  std::string field;
  /// Set unless the kind rules it out: no old value for an addition, no new
  /// one for a removal. A whole record's values are its own value.
  std::string old_value;
  std::string new_value;
  /// A renamed record's reading: "Calculator upgraded from 4.5.3 to 4.6.0".
  std::string note;
};

struct QaxDiffOptions {
  /// Also compare what changes on every scan: clocks, the Processes and
  /// Environment sections, volumes' free space and used %, and the asset
  /// summary that repeats the sections.
  bool all = false;
};

struct QaxDiff {
  std::vector<QaxChange> changes;
  /// The AssetInfo serial numbers or MAC addresses match.
  bool same_mac = true;
  std::string old_serial, new_serial, old_mac, new_mac;
};

QaxDiff diffQaxFiles(const QaxFile& old_file, const QaxFile& new_file,
                     const QaxDiffOptions& options);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_DIFF_H_
