// The one compression routine shared by the serialisers, and the failure
// path its consistency checks take.
#ifndef CVN_ZXML_ZXML_H_
#define CVN_ZXML_ZXML_H_

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cvn {

// Module names as the assertion messages print them.
inline constexpr char kZxmlModule[] = "zxml/zXML";
inline constexpr char kQaxFileModule[] = "zxml/QAXfile";
inline constexpr char kTagModule[] = "zxml/tag";

/// Prints "<module>:<line>: failed assertion `<expression>'" on stderr and
/// aborts.
[[noreturn]] void failAssertion(const char* module, unsigned line, const char* expression);

/// The longest name or value a block carries. Longer text is cut on a UTF-8
/// boundary, so that no single collected text can make a block that a reader
/// must inflate without bound.
inline constexpr size_t kMaxZxmlText = size_t{1} << 20;

/// Where a text goes in a ZXML line: a name (of a tag, a property or an
/// annotation key), followed on its line by "=", or a value (of a tag or a
/// property, or an annotation's text), which ends its line.
enum class ZxmlField { kName, kValue };

/// Writes `text` as the dump stores it in `field`, so that no collected text
/// can open, close or hide a line of markup: the text ends at its first NUL
/// byte and after kMaxZxmlText bytes; in a name "=" becomes "_", a line
/// break a blank, and a leading "+", "*", "-" or "~" an "_" (a property's
/// name begins its line); in a value a line break stays only when the line
/// it starts cannot be read as markup (it begins with none of "+", "*", "-",
/// "~" and holds no "="), otherwise it becomes a blank. Writes at most
/// min(text.size(), kMaxZxmlText) bytes at `out` and returns the count.
size_t writeZxmlText(char* out, std::string_view text, ZxmlField field);
/// The same as a string: exactly what a reader of the block gets back.
std::string zxmlText(std::string_view text, ZxmlField field);

/// One complete zlib stream of `data` at level 9, fed in 16384-byte chunks
/// (Z_FINISH once no more than 16384 bytes remain) with 16384-byte output
/// areas. `spare` extra bytes are reserved behind the stream so a caller can
/// append its trailer without reallocating. A zlib failure is fatal and
/// names `module`; an allocation failure throws std::bad_alloc.
std::vector<uint8_t> compressLevel9(const uint8_t* data, size_t size, const char* module,
                                    size_t spare = 0);

}  // namespace cvn

#endif  // CVN_ZXML_ZXML_H_
