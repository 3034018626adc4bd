// How a stored field reads to a person: sizes and speeds with their units,
// flags as "yes" and "no", dates as dates. The tree stores bare numbers
// whose unit each section's builder fixed; this is where they are named.
#ifndef CVN_TOOLS_FIELD_DISPLAY_H_
#define CVN_TOOLS_FIELD_DISPLAY_H_

#include <string>
#include <string_view>

namespace cvn {

/// The kind of a record: its name up to the colon ("Memory-slot" for
/// "Memory-slot:1"), or the whole name.
std::string_view recordKind(std::string_view record_name);

/// `value` of the field `field` of a record of kind `kind` as it reads:
/// "2048" of a memory slot's capacity is "2048 MB", a flag "1" is "yes".
/// Anything not known, or not of the expected form, is left as it is.
std::string displayValue(std::string_view kind, std::string_view field, std::string_view value);

/// A scan time ("20261123131313.000000+60") as "2026-11-23 13:13:13
/// UTC+01:00"; other text is left as it is.
std::string displayScanTime(std::string_view stamp);

}  // namespace cvn

#endif  // CVN_TOOLS_FIELD_DISPLAY_H_
