// Reading the profiler's "os_version" text ("Mac OS X 10.6.8 (10K549)"), for
// the "OS" section and for the asset summary's quick facts.
#ifndef CVN_SECTIONS_OPERATING_SYSTEM_H_
#define CVN_SECTIONS_OPERATING_SYSTEM_H_

#include <cstdint>
#include <string>
#include <string_view>

namespace cvn {

struct OsVersionText {
  /// The release name: "Mac OS X v10.6 (Snow Leopard)" for 10.0 to 10.9,
  /// else the whole "os_version" text.
  std::string name;
  /// From the version number to the end: "10.6.8 (10K549)". Empty when the
  /// text holds no version number.
  std::string version;
  /// "Update 8" for 10.6.8; empty when the third number is missing or 0.
  std::string update;
  /// The first two numbers of the version; -1 when unknown.
  int major = -1;
  int minor = -1;
};

/// Splits an "os_version" text. The rules, in order:
/// - Version start: when the text holds "OS X", the text after that marker
///   and one blank ("10.6.8 (10K549)"); when that does not begin with a digit
///   ("Mac OS X Server 10.6.8 (10K549)"), the first later word that does.
///   Without "OS X" ("macOS 10.12.6 (16G29)") the first word that begins with
///   a digit.
/// - Minor number: after "OS X" the release is taken to be 10.x, and the
///   minor number is read from the third character of the version on, up to
///   its next "." (or blank): a piece that is not a number reads as 0.
///   Without "OS X" both numbers are read from the version ("11.2.3" gives
///   11 and 2); no version means both stay -1.
/// - Name: after "OS X", the table names for 10.0 to 10.9; otherwise (a
///   later release, or a text without "OS X") the whole text.
/// - Update: the third number of the version when it is above 0, as
///   "Update %s" ("10.6.8" gives "Update 8", "10.6" and "10.6.0" give none).
OsVersionText parseOsVersion(std::string_view os_version);

/// The profiler's uptime text ("up 1:02:03:04", days:hours:minutes:seconds)
/// in seconds. Fields are read from the right; a blank ends the walk and the
/// first character is never read. Only four fields count: a fifth from the
/// right and anything before it is ignored, as is every digit of a field
/// beyond its ninth from the right.
int64_t uptimeSeconds(std::string_view uptime);

/// Seconds as a DMTF interval: "%08lld%02d%02d%02d.000000:000" (days, hours,
/// minutes, seconds); a negative count is written as 0.
std::string formatDmtfInterval(int64_t seconds);

}  // namespace cvn

#endif  // CVN_SECTIONS_OPERATING_SYSTEM_H_
