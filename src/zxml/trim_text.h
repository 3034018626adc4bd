// Trimming the blanks and line ends that tool outputs carry around their
// values, and taking the first word of a text.
#ifndef CVN_ZXML_TRIM_TEXT_H_
#define CVN_ZXML_TRIM_TEXT_H_

#include <string>
#include <string_view>

namespace cvn {

enum TrimMode : int { kTrimLeft = 1, kTrimRight = 2, kTrimBoth = 3 };

/// Removes characters of `set` from the left (mode bit 1) and/or the right
/// (mode bit 2).
std::string trimText(std::string_view text, std::string_view set, int mode);
/// The part before the first blank, trimmed of " \n\r" on both ends.
std::string firstWord(std::string_view text);

}  // namespace cvn

#endif  // CVN_ZXML_TRIM_TEXT_H_
