// Value helpers shared by the section builders and the serialisers: size
// texts such as "4 GB" or "250,06 GB", trimming, first words.
#ifndef CVN_ZXML_SIZE_TEXT_H_
#define CVN_ZXML_SIZE_TEXT_H_

#include <cstddef>
#include <cstdint>
#include <string>
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

enum TrimMode : int { kTrimLeft = 1, kTrimRight = 2, kTrimBoth = 3 };

/// Removes characters of `set` from the left (mode bit 1) and/or the right
/// (mode bit 2).
std::string trimText(std::string_view text, std::string_view set, int mode);
/// The part before the first blank, trimmed of " \n\r" on both ends.
std::string firstWord(std::string_view text);
bool equalsIgnoringCase(std::string_view a, std::string_view b);
/// The number of bytes the printf-formatted text would take.
size_t measureFormat(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace cvn

#endif  // CVN_ZXML_SIZE_TEXT_H_
