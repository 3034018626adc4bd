#include "sections/edid.h"

#include <cmath>

#include "zxml/format_text.h"

namespace cvn {
namespace {

constexpr size_t kDescriptorOffsets[] = {54, 72, 90, 108};
constexpr size_t kDescriptorSize = 18;
constexpr uint8_t kSerialDescriptor = 0xFF;
constexpr uint8_t kRangeLimitsDescriptor = 0xFD;
constexpr uint8_t kStandardTimingDescriptor = 0xFA;

int hexDigitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// A display descriptor, as opposed to a detailed timing, starts with a zero
// pixel clock; byte 3 names its kind.
bool isDescriptorOfKind(const uint8_t* descriptor, uint8_t kind) {
  return descriptor[0] == 0 && descriptor[1] == 0 && descriptor[3] == kind;
}

const uint8_t* findDescriptor(const uint8_t* edid, uint8_t kind) {
  for (size_t offset : kDescriptorOffsets) {
    if (isDescriptorOfKind(edid + offset, kind)) return edid + offset;
  }
  return nullptr;
}

struct StandardTiming {
  int width;
  int height;
  const char* aspect;
};

// The aspect code 00 always means 16:10 here, whatever the EDID version.
bool readStandardTiming(uint8_t first, uint8_t second, StandardTiming* timing) {
  // Either byte 1 marks an unused pair (the standard asks for both). A first
  // byte of 0 names no mode at all: a block whose timing bytes are all zero
  // must give no resolution rather than an invented 248 x 150.
  if (first == 0 || first == 1 || second == 1) return false;
  int x = first * 8 + 248;
  switch (second >> 6) {
    case 0:
      *timing = {x, x / 16 * 10, "16:10"};
      break;
    case 1:
      *timing = {x, x / 4 * 3, "4:3"};
      break;
    case 2:
      *timing = {x, (x * 4 / 5) & ~3, "5:4"};
      break;
    default:
      *timing = {x, x / 16 * 9, "16:9"};
      break;
  }
  return true;
}

// The eight pairs of the standard timing table, then the six pairs of every
// standard-timing descriptor.
template <typename Visit>
void forEachStandardTiming(const uint8_t* edid, Visit visit) {
  StandardTiming timing;
  for (size_t i = 38; i < 54; i += 2) {
    if (readStandardTiming(edid[i], edid[i + 1], &timing)) visit(timing);
  }
  for (size_t offset : kDescriptorOffsets) {
    const uint8_t* descriptor = edid + offset;
    if (!isDescriptorOfKind(descriptor, kStandardTimingDescriptor)) continue;
    for (size_t i = 5; i < 17; i += 2) {
      if (readStandardTiming(descriptor[i], descriptor[i + 1], &timing)) visit(timing);
    }
  }
}

void appendListItem(std::string& list, const char* item) {
  if (!list.empty()) list += ", ";
  list += item;
}

std::string serialNumberText(const uint8_t* edid) {
  if (const uint8_t* descriptor = findDescriptor(edid, kSerialDescriptor)) {
    std::string text;
    for (size_t i = 5; i < kDescriptorSize && descriptor[i] != '\n'; ++i) {
      char c = static_cast<char>(descriptor[i]);
      // The tree keeps text as it is; a stray control byte would reach the
      // console, so anything outside printable ASCII is masked.
      text += descriptor[i] >= 0x20 && descriptor[i] < 0x7F ? c : '?';
    }
    size_t end = text.find_last_not_of(' ');
    text.erase(end == std::string::npos ? 0 : end + 1);
    size_t begin = text.find_first_not_of(' ');
    if (begin != std::string::npos) return text.substr(begin);
  }
  uint32_t serial = static_cast<uint32_t>(edid[12]) | static_cast<uint32_t>(edid[13]) << 8 |
                    static_cast<uint32_t>(edid[14]) << 16 | static_cast<uint32_t>(edid[15]) << 24;
  return serial != 0 ? formatText("%u", serial) : std::string();
}

std::string synchInputText(uint8_t input) {
  std::string list;
  if (input & 0x08) appendListItem(list, "Separate");
  if (input & 0x04) appendListItem(list, "Composite");
  if (input & 0x02) appendListItem(list, "Sync on green");
  if (input & 0x01) appendListItem(list, "Serration");
  return list;
}

std::string colorFeaturesText(const uint8_t* edid) {
  static const char* const kDisplayTypes[] = {"Monochrome", "RGB color", "Non-RGB color",
                                              "Undefined"};
  // From revision 4 on, a digital input states its colour encodings instead
  // of a display type.
  static const char* const kEncodings[] = {"RGB 4:4:4", "RGB 4:4:4, YCrCb 4:4:4",
                                           "RGB 4:4:4, YCrCb 4:2:2",
                                           "RGB 4:4:4, YCrCb 4:4:4, YCrCb 4:2:2"};
  bool digital = (edid[20] & 0x80) != 0;
  bool encodings = digital && edid[18] == 1 && edid[19] >= 4;
  int code = (edid[24] >> 3) & 3;
  std::string list = encodings ? kEncodings[code] : kDisplayTypes[code];
  if (edid[24] & 0x04) appendListItem(list, "sRGB");
  return list;
}

std::string dpmsText(uint8_t features) {
  std::string list;
  if (features & 0x80) appendListItem(list, "Standby");
  if (features & 0x40) appendListItem(list, "Suspend");
  if (features & 0x20) appendListItem(list, "Active off");
  return list;
}

// The preferred detailed timing's pixels when there is one, else the image
// size; the nearest of the four known shapes within 5 %.
std::string aspectRatioText(const uint8_t* edid) {
  const uint8_t* timing = edid + 54;
  int width = 0;
  int height = 0;
  if (timing[0] != 0 || timing[1] != 0) {
    width = timing[2] | (timing[4] & 0xF0) << 4;
    height = timing[5] | (timing[7] & 0xF0) << 4;
  }
  if (width == 0 || height == 0) {
    width = edid[21];
    height = edid[22];
  }
  if (width == 0 || height == 0) return std::string();
  struct Shape {
    double ratio;
    const char* text;
  };
  static const Shape kShapes[] = {
      {16.0 / 10.0, "16:10"}, {4.0 / 3.0, "4:3"}, {5.0 / 4.0, "5:4"}, {16.0 / 9.0, "16:9"}};
  double ratio = static_cast<double>(width) / height;
  const Shape* best = nullptr;
  double best_error = 0.05;
  for (const Shape& shape : kShapes) {
    double error = std::fabs(ratio - shape.ratio) / shape.ratio;
    if (error <= best_error) {
      best = &shape;
      best_error = error;
    }
  }
  return best ? best->text : std::string();
}

void readRangeLimits(const uint8_t* edid, EdidInfo* info) {
  const uint8_t* descriptor = findDescriptor(edid, kRangeLimitsDescriptor);
  if (!descriptor) return;
  // Byte 4 adds 255 to a limit that does not fit in a byte (revision 4).
  uint8_t offsets = descriptor[4];
  int v_min = descriptor[5] + ((offsets & 0x03) == 0x03 ? 255 : 0);
  int v_max = descriptor[6] + ((offsets & 0x02) ? 255 : 0);
  int h_min = descriptor[7] + ((offsets & 0x0C) == 0x0C ? 255 : 0);
  int h_max = descriptor[8] + ((offsets & 0x08) ? 255 : 0);
  info->has_range_limits = true;
  info->h_freq = {formatText("%d", h_min), formatText("%d", h_max)};
  info->v_freq = {formatText("%d", v_min), formatText("%d", v_max)};
}

}  // namespace

std::vector<uint8_t> edidBytesFromText(std::string_view text) {
  static constexpr std::string_view kBlanks = " \t\r\n";
  size_t begin = text.find_first_not_of(kBlanks);
  if (begin == std::string_view::npos) return {};
  text = text.substr(begin, text.find_last_not_of(kBlanks) - begin + 1);
  if (text.size() >= 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
    text.remove_prefix(2);
  }
  if (text.size() % 2 != 0 || text.size() / 2 < kEdidBlockSize) return {};
  std::vector<uint8_t> bytes;
  bytes.reserve(text.size() / 2);
  for (size_t i = 0; i < text.size(); i += 2) {
    int high = hexDigitValue(text[i]);
    int low = hexDigitValue(text[i + 1]);
    if (high < 0 || low < 0) return {};
    bytes.push_back(static_cast<uint8_t>(high << 4 | low));
  }
  return bytes;
}

std::string edidManufacturer(uint16_t value) {
  return formatText("%c%c%c", (value >> 10 & 0x1F) | 0x40, (value >> 5 & 0x1F) | 0x40,
                    (value & 0x1F) | 0x40);
}

std::string edidProductCode(uint16_t value) {
  // The sign extension is the point: 0x80 prints as FFFFFF80.
  auto widen = [](unsigned byte) {
    return static_cast<unsigned>(static_cast<int>(static_cast<int8_t>(byte & 0xFF)));
  };
  return formatText("%2X%2X", widen(value >> 8), widen(value));
}

std::string edidMaxResolution(const uint8_t* edid) {
  int width = 0;
  int height = 0;
  int area = 0;
  auto take = [&](int x, int y) {
    width = x;
    height = y;
    area = x * y;
  };
  uint8_t t1 = edid[35];
  uint8_t t2 = edid[36];
  uint8_t t3 = edid[37];
  if (t1 & 0x03) {
    take(800, 600);
  } else if (t1 & 0x3C) {
    take(640, 480);
  } else if (t1 & 0xC0) {
    take(720, 400);
  }
  if ((t1 & 0x03) == 0 && t2 >= 64) take(800, 600);
  if (t2 & 0x20) take(832, 624);
  if ((t2 & 0x1E) && area <= 786432) take(1024, 768);
  if ((t3 & 0x80) && area <= 1002240) take(1152, 870);
  // Bit 0 of byte 37, not byte 36: that is the rule, standard or not.
  if ((t3 & 0x01) && area <= 1310720) take(1280, 1024);
  forEachStandardTiming(edid, [&](const StandardTiming& timing) {
    if (timing.width * timing.height >= area) take(timing.width, timing.height);
  });
  return area != 0 ? formatText("%d x %d", width, height) : std::string();
}

bool decodeEdid(const uint8_t* edid, size_t size, EdidInfo* info) {
  if (!edid || size < kEdidBlockSize) return false;
  EdidInfo out;
  // Bytes 8 and 9 are big-endian; the product code of 10 and 11 is stored
  // least significant byte first.
  out.manufacturer = edidManufacturer(static_cast<uint16_t>(edid[8] << 8 | edid[9]));
  out.product_code = edidProductCode(static_cast<uint16_t>(edid[11] << 8 | edid[10]));
  out.serial_number = serialNumberText(edid);
  out.week = formatText("%d", edid[16]);
  out.year = formatText("%d", edid[17] + 1990);
  out.max_resolution = edidMaxResolution(edid);
  bool digital = (edid[20] & 0x80) != 0;
  out.video_input = digital ? "Digital" : "Analog";
  out.synch_input = digital ? std::string() : synchInputText(edid[20]);
  out.serial_digital = digital && (edid[20] & 0x01) ? "1" : "0";
  out.color_features = colorFeaturesText(edid);
  out.dpms_mode_support = dpmsText(edid[24]);
  if (edid[23] != 0xFF) out.gamma = formatText("%.2f", (edid[23] + 100) / 100.0);
  out.aspect_ratio = aspectRatioText(edid);
  if (edid[21] != 0 && edid[22] != 0) {
    out.has_image_size = true;
    out.image_width = formatText("%d", edid[21]);
    out.image_height = formatText("%d", edid[22]);
    double inches = std::sqrt(edid[21] * edid[21] + edid[22] * edid[22]) / 2.54;
    out.image_diagonal = formatText("%u", static_cast<unsigned>(std::lround(inches)));
  }
  readRangeLimits(edid, &out);
  forEachStandardTiming(edid, [&](const StandardTiming& timing) {
    out.video_modes.push_back(
        formatText("%d x %d (%s)", timing.width, timing.height, timing.aspect));
  });
  *info = std::move(out);
  return true;
}

bool decodeEdidText(std::string_view text, EdidInfo* info) {
  std::vector<uint8_t> bytes = edidBytesFromText(text);
  return decodeEdid(bytes.data(), bytes.size(), info);
}

std::string edidDiagonalText(std::string_view text) {
  EdidInfo info;
  return decodeEdidText(text, &info) ? info.image_diagonal : std::string();
}

}  // namespace cvn
