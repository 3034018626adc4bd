// Bytes that CoreFoundation takes in a property list but expat refuses or
// changes, carried through expat losslessly.
#ifndef CVN_COLLECT_PLIST_BYTES_H_
#define CVN_COLLECT_PLIST_BYTES_H_

#include <string>
#include <string_view>

namespace cvn {

// Profilers print bytes that CoreFoundation takes but expat refuses (raw
// control characters, stray bytes that are not UTF-8) and CR bytes that expat
// would turn into LF. Before parsing, each such byte b in character data
// becomes the private-use character U+F700+b, and after parsing every
// U+F700..U+F7FF in a string or key turns back into its byte. Genuine
// characters of U+F700..U+F8FF in the input are escaped byte by byte the same
// way, so the round trip is lossless. U+F800 marks a value that
// CoreFoundation would refuse (an unknown entity, a broken reference); the
// reader drops that one value.

/// The document with every such byte of character data escaped, ready for
/// expat (read as UTF-8). Markup is kept as it is. The result is a view of
/// `document` itself when nothing had to change (the usual case), else of
/// `storage`, which then holds the escaped copy.
std::string_view escapeRefusedBytes(std::string_view document, std::string* storage);

/// Turns escaped bytes of a parsed string or key back into bytes, in place.
/// False when the text holds the mark of a value CoreFoundation would refuse.
bool restoreEscapedBytes(std::string& text);

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_BYTES_H_
