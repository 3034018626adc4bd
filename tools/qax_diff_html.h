// The diff of two results as a page: one table per section, each row
// marked added, removed or changed.
#ifndef CVN_TOOLS_QAX_DIFF_HTML_H_
#define CVN_TOOLS_QAX_DIFF_HTML_H_

#include <string>
#include <string_view>

#include "qax_diff.h"
#include "qax_reader.h"

namespace cvn {

std::string renderDiffHtml(const QaxDiff& diff, const QaxFile& old_file, std::string_view old_name,
                           const QaxFile& new_file, std::string_view new_name);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_DIFF_HTML_H_
