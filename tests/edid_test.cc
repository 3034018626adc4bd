#include "sections/edid.h"

#include <gtest/gtest.h>

#include <cstring>
#include <initializer_list>
#include <string>
#include <tuple>
#include <utility>

namespace cvn {
namespace {

// The profiler's hexadecimal text of a zero block with the given byte runs.
std::string edidText(std::initializer_list<std::pair<size_t, const char*>> runs) {
  std::string text = "0x" + std::string(2 * kEdidBlockSize, '0');
  for (const auto& [at, hex] : runs) text.replace(2 + 2 * at, std::strlen(hex), hex);
  return text;
}

TEST(EdidTest, MaxResolutionFollowsTheTimingRules) {
  const std::tuple<const char*, std::string, const char*> cases[] = {
      {"all timing bytes zero", edidText({}), ""},
      {"byte 35 of 3", edidText({{35, "03"}}), "800 x 600"},
      {"byte 35 of 4", edidText({{35, "04"}}), "640 x 480"},
      {"byte 35 of 64", edidText({{35, "40"}}), "720 x 400"},
      {"byte 36 of 64", edidText({{36, "40"}}), "800 x 600"},
      {"byte 36 bit 5", edidText({{36, "20"}}), "832 x 624"},
      {"byte 36 bits 1 and 5", edidText({{36, "22"}}), "1024 x 768"},
      {"byte 36 bit 0 alone", edidText({{36, "01"}}), ""},
      {"byte 37 of 1", edidText({{37, "01"}}), "1280 x 1024"},
      {"pair 209,0 is 16:10", edidText({{38, "d100"}}), "1920 x 1200"},
      {"pair 1,64 skipped", edidText({{38, "0140"}}), ""},
      {"first byte zero skipped", edidText({{38, "0040"}}), ""},
      // 880 x 660 and 968 x 600 share their area.
      {"tie, later wins", edidText({{38, "4f405a00"}}), "968 x 600"},
      {"tie swapped", edidText({{38, "5a004f40"}}), "880 x 660"},
      {"descriptor 0xFA", edidText({{75, "fa"}, {87, "a9c0"}}), "1600 x 900"},
  };
  for (const auto& [name, edid, expected] : cases) {
    EXPECT_EQ(edidMaxResolution(edidBytesFromText(edid).data()), expected) << name;
  }
}

TEST(EdidTest, DecodesIdentityDateDiagonalAndText) {
  // High byte of 128 or more sign-extends; below 16 it is blank-padded.
  EXPECT_EQ(edidProductCode(0x8005) + "|" + edidProductCode(0x0FA0), "FFFFFF80 5| FFFFFFFA0");
  EdidInfo info;
  ASSERT_TRUE(decodeEdidText(edidText({{8, "10ac"}, {16, "3114"}, {21, "2f1e"}}), &info));
  EXPECT_EQ(info.manufacturer + " " + info.week + " " + info.year + " " + info.aspect_ratio,
            "DEL 49 2010 16:10");
  EXPECT_EQ(edidDiagonalText(edidText({{21, "2f1e"}})), "22");
  // Input, synchronisation, serial flag, colour, power modes and gamma.
  const std::pair<std::string, const char*> features[] = {
      {edidText({{20, "80"}, {23, "78"}, {24, "ea"}}),
       "Digital||0|RGB color|Standby, Suspend, Active off|2.20"},
      {edidText({{20, "81"}, {23, "ff"}, {24, "04"}}), "Digital||1|Monochrome, sRGB||"},
      {edidText({{20, "0f"}, {23, "00"}, {24, "18"}}),
       "Analog|Separate, Composite, Sync on green, Serration|0|Undefined||1.00"},
  };
  for (const auto& [edid, expected] : features) {
    ASSERT_TRUE(decodeEdidText(edid, &info));
    EXPECT_EQ(info.video_input + "|" + info.synch_input + "|" + info.serial_digital + "|" +
                  info.color_features + "|" + info.dpms_mode_support + "|" + info.gamma,
              expected);
  }
  EXPECT_EQ(edidDiagonalText(edidText({{21, "2f"}})), "");

  // The text form needs a whole block of hexadecimal pairs.
  std::string text = edidText({});
  EXPECT_EQ(edidBytesFromText(" " + text.substr(2) + "\n").size(), kEdidBlockSize);
  const std::string bad[] = {
      "",
      "0x",
      text.substr(0, text.size() - 2),  // 127 bytes
      text.substr(0, text.size() - 1),  // odd
      text.substr(0, 100) + "zz" + text.substr(102),
  };
  for (const std::string& t : bad) {
    EXPECT_TRUE(edidBytesFromText(t).empty()) << t;
    EXPECT_FALSE(decodeEdidText(t, &info)) << t;
  }
}

// What the sample Macs' displays do not print: range limits in any of the
// four descriptors and revision 4's offsets to them, colour encodings, a
// detailed timing without a height, and the terminator after a
// standard-timing descriptor's six pairs.
TEST(EdidTest, RevisionFourFieldsAndDescriptorEdges) {
  const std::pair<std::string, const char*> cases[] = {
      {edidText({{57, "fd0a1e2c0a14"}}), "30-299 10-275||Monochrome|"},
      {edidText({{93, "fd0f1e2c0a14"}}), "285-299 265-275||Monochrome|"},
      {edidText({{111, "fd001e2c0a14"}}), "30-44 10-20||Monochrome|"},
      {edidText({{18, "0104"}, {20, "80"}, {24, "08"}}), "- -||RGB 4:4:4, YCrCb 4:4:4|"},
      {edidText({{54, "0100800000"}, {21, "2f1e"}}), "- -||Monochrome|16:10"},
      {edidText({{75, "fa"}, {87, "a9c00a"}}), "- -|1600 x 900 (16:9)|Monochrome|"},
  };
  for (const auto& [edid, expected] : cases) {
    EdidInfo info;
    ASSERT_TRUE(decodeEdidText(edid, &info));
    std::string modes;
    for (const std::string& mode : info.video_modes) modes += mode;
    EXPECT_EQ(info.v_freq.min + "-" + info.v_freq.max + " " + info.h_freq.min + "-" +
                  info.h_freq.max + "|" + modes + "|" + info.color_features + "|" +
                  info.aspect_ratio,
              expected);
  }
}

}  // namespace
}  // namespace cvn
