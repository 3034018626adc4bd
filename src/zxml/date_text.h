// Dates as the snapshot writes them: local time with the zone as minutes.
#ifndef CVN_ZXML_DATE_TEXT_H_
#define CVN_ZXML_DATE_TEXT_H_

#include <cstdint>
#include <string>

namespace cvn {

/// `seconds` (since the epoch) in the local zone. Long form:
/// "yyyyMMddHHmmss.000000" followed by the zone's sign and its offset in
/// minutes without padding ("+180", "-300", "+0"); short form "yyyy-MM-dd".
/// Empty when the date cannot be represented in local time.
std::string formatLocalDate(int64_t seconds, bool long_form);
/// The same without reading the zone again: for many dates in a row, after
/// one formatLocalDate() or tzset(). Re-reading costs a look at the zone
/// file for every date.
std::string formatLocalDateInCurrentZone(int64_t seconds, bool long_form);

}  // namespace cvn

#endif  // CVN_ZXML_DATE_TEXT_H_
