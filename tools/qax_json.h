// The inspector's JSON view of a whole result file.
#ifndef CVN_TOOLS_QAX_JSON_H_
#define CVN_TOOLS_QAX_JSON_H_

#include <string>
#include <string_view>

#include "qax_reader.h"

namespace cvn {

/// `s` as a JSON string, quotes included.
void appendJsonString(std::string_view s, std::string& out);
/// The directory and the trees as JSON.
std::string renderQaxJson(const QaxFile& file);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_JSON_H_
