// printf into a std::string, for the fixed formats of field texts, and the
// measuring that sizes the serialisers' buffers by the same formats.
#ifndef CVN_ZXML_FORMAT_TEXT_H_
#define CVN_ZXML_FORMAT_TEXT_H_

#include <cstddef>
#include <string>

namespace cvn {

std::string formatText(const char* format, ...) __attribute__((format(printf, 1, 2)));
/// The number of bytes the printf-formatted text would take.
size_t measureFormat(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace cvn

#endif  // CVN_ZXML_FORMAT_TEXT_H_
