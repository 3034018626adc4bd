// printf into a std::string, for the fixed formats of field texts.
#ifndef CVN_ZXML_FORMAT_TEXT_H_
#define CVN_ZXML_FORMAT_TEXT_H_

#include <string>

namespace cvn {

std::string formatText(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace cvn

#endif  // CVN_ZXML_FORMAT_TEXT_H_
