// EDID decoding for the displays section and the asset summary.
#ifndef CVN_SECTIONS_EDID_H_
#define CVN_SECTIONS_EDID_H_

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cvn {

/// The EDID bytes of the profiler's "_spdisplays_edid" text (hexadecimal
/// pairs, optionally behind "0x"). Empty when the text holds no EDID.
std::vector<uint8_t> edidBytesFromText(std::string_view text);

/// Three letters from the 16-bit value of bytes 8 and 9.
std::string edidManufacturer(uint16_t value);
/// "%2X%2X" of the high and low byte, each widened as a signed 8-bit number.
std::string edidProductCode(uint16_t value);
/// "%d x %d" from the timing tables, or empty. `edid` holds 128 bytes.
std::string edidMaxResolution(const uint8_t* edid);

}  // namespace cvn

#endif  // CVN_SECTIONS_EDID_H_
