// Size texts of the profiler such as "4 GB" or "250,06 GB", read as numbers
// of a fixed unit.
#ifndef CVN_ZXML_SIZE_TEXT_H_
#define CVN_ZXML_SIZE_TEXT_H_

#include <cstdint>
#include <string_view>

namespace cvn {

/// Parses texts made of a number (a decimal comma allowed), one separator
/// character and a two-letter unit ("KB", "MB", "GB", "TB", case-sensitive).
/// An unknown unit, or a text shorter than three characters, gives 0.
struct SizeText {
  /// In kilobytes of 1024 bytes; "TB" counts 1073741824 KB.
  static double toKilobytes(std::string_view text);
  /// In gigabytes; "TB" counts 1000 GB (decimal), the others binary.
  static double toGigabytes(std::string_view text);
  /// toGigabytes() x 1073741824, truncated.
  static int64_t toBytes(std::string_view text);
  /// Bytes / 10^9. With `round`, the whole part, plus one when the cut-off
  /// fraction is above 0.4.
  static double toDecimalGigabytes(std::string_view text, bool round);
};

}  // namespace cvn

#endif  // CVN_ZXML_SIZE_TEXT_H_
