// Comparing texts without regard to case, as the property-list readers do
// for the names of special numbers ("NaN", "-Infinity").
#ifndef CVN_ZXML_TEXT_CASE_H_
#define CVN_ZXML_TEXT_CASE_H_

#include <string_view>

namespace cvn {

/// True when the texts are equal once every ASCII letter of both is lower
/// case. Bytes past ASCII must match exactly, whatever the locale.
bool equalsIgnoringCase(std::string_view a, std::string_view b);

}  // namespace cvn

#endif  // CVN_ZXML_TEXT_CASE_H_
