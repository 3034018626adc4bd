// UTF-8 taken a sequence at a time. The property-list cleaning, the block
// writer's cut, the result file's name and the inspector's JSON must agree on
// what one character is, so they all ask here. The inspector does not link
// the agent's library, so this file is a library of its own that both link.
#ifndef CVN_ZXML_UTF8_TEXT_H_
#define CVN_ZXML_UTF8_TEXT_H_

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace cvn {

/// True for the bytes 80-BF, which only continue a sequence.
inline bool isUtf8Continuation(unsigned char b) { return (b & 0xC0) == 0x80; }

/// The length of the well-formed sequence that starts `p[0..n)`, with its
/// code point in `code_point`: one for an ASCII byte, two to four for the
/// rest; 0 for an overlong form, a surrogate, a value above U+10FFFF, a lead
/// byte C0, C1 or F5-FF, a stray continuation byte or a cut-off sequence.
size_t utf8SequenceLength(const unsigned char* p, size_t n, uint32_t* code_point);

/// How much of `text` to keep so that at most `limit` bytes remain and no
/// sequence is split: `limit`, less the continuation bytes (three at most)
/// that the cut would separate from their lead byte; all of a shorter text.
size_t utf8CutLength(std::string_view text, size_t limit);

}  // namespace cvn

#endif  // CVN_ZXML_UTF8_TEXT_H_
