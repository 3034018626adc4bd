// The leaf values of a property list, read the way CoreFoundation reads
// them. Each returns false for text CoreFoundation refuses.
#ifndef CVN_COLLECT_PLIST_LEAVES_H_
#define CVN_COLLECT_PLIST_LEAVES_H_

#include <cstdint>
#include <string>
#include <string_view>

namespace cvn {

/// The value of one decimal digit, or of a hexadecimal one when `hex`.
bool digitValue(unsigned char c, bool hex, unsigned* value);
/// Decimal or "0x" hexadecimal, signed, blanks around; literals above
/// 2^63-1 keep their low 64 bits.
bool parsePlistInteger(std::string_view text, int64_t* out);
/// The C form of strtod, plus "nan", "inf" and "infinity" in any case.
bool parsePlistReal(std::string_view text, double* out);
/// -?Y+-MM-DDTHH:MM:SSZ as seconds since 1970-01-01T00:00:00Z. Fields are
/// not range-checked, only converted arithmetically.
bool parsePlistDate(std::string_view text, int64_t* out);
/// Base64, skipping blanks, padding and stray punctuation; appends to `out`.
bool decodePlistBase64(std::string_view text, std::string* out);

}  // namespace cvn

#endif  // CVN_COLLECT_PLIST_LEAVES_H_
