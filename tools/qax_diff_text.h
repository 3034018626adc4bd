// The diff as a person reads it in a terminal, and as JSON for scripts.
#ifndef CVN_TOOLS_QAX_DIFF_TEXT_H_
#define CVN_TOOLS_QAX_DIFF_TEXT_H_

#include <string>

#include "qax_diff.h"

namespace cvn {

/// One block per section: its name, then "+ record", "- record" or
/// "~ record" and under a changed record its fields as
/// `field: "old" -> "new"`. Names and values are escaped for the terminal.
/// Nothing at all when nothing changed.
std::string renderDiffText(const QaxDiff& diff);
/// A JSON list of {section, record, change, field, old, new}; field is null
/// for a whole record, "" for the record's own value.
std::string renderDiffJson(const QaxDiff& diff);
/// The line that says two results are of different Macs, without a line end.
std::string differentMacText(const QaxDiff& diff);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_DIFF_TEXT_H_
