// EDID decoding for the displays section and the asset summary.
#ifndef CVN_SECTIONS_EDID_H_
#define CVN_SECTIONS_EDID_H_

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cvn {

/// The size of the EDID base block; shorter input holds no EDID.
constexpr size_t kEdidBlockSize = 128;

/// The EDID bytes of the profiler's "_spdisplays_edid" text: hexadecimal
/// pairs, optionally behind "0x" and surrounded by blanks. Empty when the text
/// holds no EDID: odd length, a character that is not a hexadecimal digit, or
/// fewer than 128 bytes.
std::vector<uint8_t> edidBytesFromText(std::string_view text);

/// Three letters from the 16-bit value of bytes 8 and 9.
std::string edidManufacturer(uint16_t value);
/// "%2X%2X" of the high and low byte, each widened as a signed 8-bit number.
std::string edidProductCode(uint16_t value);
/// "%d x %d" from the timing tables, or empty. `edid` holds 128 bytes.
std::string edidMaxResolution(const uint8_t* edid);

/// A minimum and maximum from the range-limits descriptor, as "%d" texts.
struct EdidRange {
  std::string min;
  std::string max;
};

/// Everything the monitor record takes from one EDID base block. Texts are
/// ready to be written; lists are joined with ", ".
struct EdidInfo {
  std::string manufacturer;
  std::string product_code;
  /// The serial-number descriptor's text, else the 32-bit serial of bytes
  /// 12 to 15 as "%u" when it is not 0, else empty.
  std::string serial_number;
  std::string week;
  std::string year;
  std::string max_resolution;
  /// "Digital" or "Analog".
  std::string video_input;
  /// The sync kinds of an analog input; empty for a digital one.
  std::string synch_input;
  /// "1" for a digital input on a serial (TMDS) link, else "0".
  std::string serial_digital;
  std::string color_features;
  std::string dpms_mode_support;
  /// "%.2f", or empty when the block defers gamma to an extension.
  std::string gamma;
  /// "16:10", "4:3", "5:4" or "16:9", or empty when none fits.
  std::string aspect_ratio;

  /// Bytes 21 and 22 in centimetres; only when both are set.
  bool has_image_size = false;
  std::string image_width;
  std::string image_height;
  /// Whole inches.
  std::string image_diagonal;

  /// From the range-limits descriptor: kHz and Hz.
  bool has_range_limits = false;
  EdidRange h_freq;
  EdidRange v_freq;

  /// "%d x %d (%s)" for every standard timing, in table order.
  std::vector<std::string> video_modes;
};

/// Decodes the base block at `edid`. False, leaving `info` alone, when
/// `size` is below 128.
bool decodeEdid(const uint8_t* edid, size_t size, EdidInfo* info);
/// Decodes the profiler's hexadecimal text (see edidBytesFromText).
bool decodeEdidText(std::string_view text, EdidInfo* info);

/// The visible diagonal in whole inches as "%u", from the maximum visible
/// image size: sqrt(w^2 + h^2) / 2.54, rounded to nearest. Empty when the
/// text holds no EDID or the EDID gives no size.
std::string edidDiagonalText(std::string_view text);

}  // namespace cvn

#endif  // CVN_SECTIONS_EDID_H_
