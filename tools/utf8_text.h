// Collected text is whatever the Mac held: the inspector's views decide
// character by character what they may pass through to a terminal or page.
#ifndef CVN_TOOLS_UTF8_TEXT_H_
#define CVN_TOOLS_UTF8_TEXT_H_

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace cvn {

/// The length of the well-formed UTF-8 sequence at `at` (1 to 4), or 0 when
/// the bytes there are no such sequence (stray continuation bytes, overlong
/// forms, surrogates, code points past U+10FFFF, a cut-off end).
size_t utf8SequenceLength(std::string_view text, size_t at);
/// The code point of a sequence that utf8SequenceLength accepted.
uint32_t utf8CodePoint(std::string_view text, size_t at, size_t length);

/// `text` made safe for a terminal line: valid printable UTF-8 passes, the
/// rest (line breaks, escape sequences, C1 controls, bytes that are no
/// UTF-8) is written as \n, \t, \xNN or \u00NN; with `quoted`, in double
/// quotes with \" and \\ so that values read unambiguously.
std::string terminalText(std::string_view text, bool quoted);

}  // namespace cvn

#endif  // CVN_TOOLS_UTF8_TEXT_H_
