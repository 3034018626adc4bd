// One result as a page a person can read or attach to a ticket: the
// summary first, then every section as tables.
#ifndef CVN_TOOLS_QAX_HTML_H_
#define CVN_TOOLS_QAX_HTML_H_

#include <string>
#include <string_view>

#include "qax_reader.h"

namespace cvn {

/// The whole page; `file_name` is shown as the result's name.
std::string renderQaxHtml(const QaxFile& file, std::string_view file_name);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_HTML_H_
