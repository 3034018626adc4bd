// The few facts support staff ask for first, gathered from a result's
// trees: what Mac it is, what it holds, who used it and when it was
// scanned. The asset summary is preferred where it has the fact, the
// sections fill in where it has not (a debug scan has no summary).
#ifndef CVN_TOOLS_MAC_SUMMARY_H_
#define CVN_TOOLS_MAC_SUMMARY_H_

#include <string>
#include <string_view>
#include <vector>

#include "qax_reader.h"

namespace cvn {

struct MacSummaryLine {
  std::string label;
  /// One entry for most lines; one per disk or volume. Empty when unknown.
  std::vector<std::string> values;
};

struct MacSummary {
  /// What names the Mac in a heading: its host name, else its computer
  /// name, else its model.
  std::string name;
  std::string scanned;  // the scan time as it reads
  std::vector<MacSummaryLine> lines;
};

/// The top tag of the first tree block of that directory type, or null.
const QaxNode* findTreeTop(const QaxFile& file, std::string_view type);

MacSummary summarizeMac(const QaxFile& file, std::string_view file_name);

}  // namespace cvn

#endif  // CVN_TOOLS_MAC_SUMMARY_H_
