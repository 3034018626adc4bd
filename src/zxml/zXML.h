// The one compression routine shared by the serialisers, and the failure
// path its consistency checks take.
#ifndef CVN_ZXML_ZXML_H_
#define CVN_ZXML_ZXML_H_

#include <cstddef>
#include <cstdint>
#include <vector>

namespace cvn {

// Module names as the assertion messages print them.
inline constexpr char kZxmlModule[] = "zxml/zXML";
inline constexpr char kQaxFileModule[] = "zxml/QAXfile";
inline constexpr char kTagModule[] = "zxml/tag";

/// Prints "<module>:<line>: failed assertion `<expression>'" on stderr and
/// aborts.
[[noreturn]] void failAssertion(const char* module, unsigned line, const char* expression);

/// One complete zlib stream of `data` at level 9, fed in 16384-byte chunks
/// (Z_FINISH once no more than 16384 bytes remain) with 16384-byte output
/// areas. `spare` extra bytes are reserved behind the stream so a caller can
/// append its trailer without reallocating. A zlib failure is fatal and
/// names `module`; an allocation failure throws std::bad_alloc.
std::vector<uint8_t> compressLevel9(const uint8_t* data, size_t size, const char* module,
                                    size_t spare = 0);

}  // namespace cvn

#endif  // CVN_ZXML_ZXML_H_
