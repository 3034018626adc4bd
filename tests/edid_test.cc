#include "sections/edid.h"

#include <gtest/gtest.h>

#include <array>
#include <initializer_list>
#include <utility>

namespace cvn {
namespace {

using Block = std::array<uint8_t, kEdidBlockSize>;

// A block without timings: every standard timing pair marked unused.
Block emptyBlock() {
  Block edid{};
  for (size_t i = 38; i < 54; ++i) edid[i] = 1;
  return edid;
}

Block blockWith(std::initializer_list<std::pair<size_t, uint8_t>> bytes) {
  Block edid = emptyBlock();
  for (const auto& [offset, value] : bytes) edid[offset] = value;
  return edid;
}

std::string hexText(const uint8_t* bytes, size_t size) {
  static const char kDigits[] = "0123456789abcdef";
  std::string text = "0x";
  for (size_t i = 0; i < size; ++i) {
    text += kDigits[bytes[i] >> 4];
    text += kDigits[bytes[i] & 15];
  }
  return text;
}

struct ResolutionCase {
  const char* name;
  Block edid;
  const char* expected;
};

TEST(EdidTest, MaxResolutionFollowsTheTimingRules) {
  const ResolutionCase cases[] = {
      {"no timings", emptyBlock(), ""},
      {"byte 35 bits 0 and 1", blockWith({{35, 3}}), "800 x 600"},
      {"byte 35 bit 2", blockWith({{35, 0x04}}), "640 x 480"},
      {"byte 35 bit 7", blockWith({{35, 0x80}}), "720 x 400"},
      {"byte 36 of 64 or more", blockWith({{35, 0x80}, {36, 0x40}}), "800 x 600"},
      {"byte 36 bit 5 alone", blockWith({{36, 0x20}}), "832 x 624"},
      {"byte 36 bits 1 and 5", blockWith({{36, 0x22}}), "1024 x 768"},
      {"byte 36 bit 0 alone", blockWith({{36, 0x01}}), ""},
      {"byte 37 bit 7", blockWith({{37, 0x80}}), "1152 x 870"},
      {"byte 37 of 1", blockWith({{37, 1}}), "1280 x 1024"},
      {"pair 209,0 is 16:10", blockWith({{38, 209}, {39, 0}}), "1920 x 1200"},
      {"pair 129,64 is 4:3", blockWith({{38, 129}, {39, 64}}), "1280 x 960"},
      {"pair 129,128 is 5:4", blockWith({{38, 129}, {39, 128}}), "1280 x 1024"},
      {"pair 209,192 is 16:9", blockWith({{38, 209}, {39, 192}}), "1920 x 1080"},
      {"pair 1,64 skipped", blockWith({{38, 1}, {39, 64}}), ""},
      {"pair 129,1 skipped", blockWith({{37, 1}, {38, 129}, {39, 1}}), "1280 x 1024"},
      {"smaller timing keeps the best", blockWith({{38, 209}, {39, 0}, {40, 129}, {41, 64}}),
       "1920 x 1200"},
      // 880 x 660 and 968 x 600 share their area, as do 720 x 400 and 600 x 480.
      {"equal area, later wins", blockWith({{38, 79}, {39, 64}, {40, 90}, {41, 0}}), "968 x 600"},
      {"equal area, order swapped", blockWith({{38, 90}, {39, 0}, {40, 79}, {41, 64}}),
       "880 x 660"},
      {"standard timing ties an established one", blockWith({{35, 0x80}, {38, 44}, {39, 128}}),
       "600 x 480"},
      {"all timing bytes zero", Block{}, ""},
      {"first byte zero skipped", blockWith({{38, 0}, {39, 64}}), ""},
      {"descriptor 0xFA", blockWith({{72 + 3, 0xFA}, {72 + 15, 169}, {72 + 16, 0xC0}}),
       "1600 x 900"},
      {"descriptor needs zero pixel clock",
       blockWith({{72, 1}, {72 + 3, 0xFA}, {72 + 15, 169}, {72 + 16, 0xC0}}), ""},
  };
  for (const ResolutionCase& c : cases) {
    EXPECT_EQ(edidMaxResolution(c.edid.data()), c.expected) << c.name;
  }
}

TEST(EdidTest, ProductCodeKeepsSignExtensionAndBlankPadding) {
  EXPECT_EQ(edidProductCode(0x1234), "1234");
  EXPECT_EQ(edidProductCode(0x8005), "FFFFFF80 5");
  EXPECT_EQ(edidProductCode(0x0FA0), " FFFFFFFA0");
  EXPECT_EQ(edidProductCode(0x7F10), "7F10");
}

TEST(EdidTest, ManufacturerLettersComeFromFiveBitGroups) {
  EXPECT_EQ(edidManufacturer(0x0610), "APP");
  EXPECT_EQ(edidManufacturer(0x10AC), "DEL");
}

TEST(EdidTest, DecodesIdentityAndDate) {
  Block edid = blockWith({{8, 0x10}, {9, 0xAC}, {10, 0x05}, {11, 0xA0}, {16, 49}, {17, 20}});
  EdidInfo info;
  ASSERT_TRUE(decodeEdid(edid.data(), edid.size(), &info));
  EXPECT_EQ(info.manufacturer, "DEL");
  EXPECT_EQ(info.product_code, "FFFFFFA0 5");
  EXPECT_EQ(info.week, "49");
  EXPECT_EQ(info.year, "2010");
  EXPECT_EQ(info.serial_number, "");
}

TEST(EdidTest, TextFormNeedsAWholeBlockOfHexPairs) {
  Block edid = blockWith({{8, 0x06}, {9, 0x10}});
  std::string text = hexText(edid.data(), edid.size());
  EdidInfo info;
  EXPECT_TRUE(decodeEdidText(text, &info));
  EXPECT_EQ(info.manufacturer, "APP");
  EXPECT_EQ(edidBytesFromText(" " + text.substr(2) + "\n").size(), kEdidBlockSize);

  const std::string bad[] = {
      "",
      "0x",
      text.substr(0, text.size() - 2),  // 127 bytes
      text.substr(0, text.size() - 1),  // odd
      text.substr(0, 100) + "zz" + text.substr(102),
      "0x00ffffffffffff00",
  };
  for (const std::string& t : bad) {
    EXPECT_TRUE(edidBytesFromText(t).empty()) << t;
    EXPECT_FALSE(decodeEdidText(t, &info)) << t;
    EXPECT_EQ(edidDiagonalText(t), "") << t;
  }
}

TEST(EdidTest, DecodesFeaturesSizeRangesAndModes) {
  Block edid = blockWith({
      {18, 1},        {19, 3},       {20, 0x0E},  // analog: separate, composite, sync on green
      {21, 47},       {22, 30},                   // 47 x 30 cm
      {23, 120},                                  // gamma 2.20
      {24, 0xEE},                                 // standby, suspend, active off; RGB; sRGB
      {38, 209},      {39, 0},       {40, 129},     {41, 64},      {54, 0x9A},
      {55, 0x29},     {56, 0x80},    {58, 0x70},    {59, 0xB0},    {61, 0x40},  // 1920 x 1200
      {72 + 3, 0xFD}, {72 + 5, 56},  {72 + 6, 76},  {72 + 7, 30},  {72 + 8, 83},
      {90 + 3, 0xFF}, {90 + 5, 'G'}, {90 + 6, '2'}, {90 + 7, '7'}, {90 + 8, '\n'},
  });
  EdidInfo info;
  ASSERT_TRUE(decodeEdid(edid.data(), edid.size(), &info));
  EXPECT_EQ(info.video_input, "Analog");
  EXPECT_EQ(info.synch_input, "Separate, Composite, Sync on green");
  EXPECT_EQ(info.serial_digital, "0");
  EXPECT_EQ(info.color_features, "RGB color, sRGB");
  EXPECT_EQ(info.dpms_mode_support, "Standby, Suspend, Active off");
  EXPECT_EQ(info.gamma, "2.20");
  EXPECT_EQ(info.aspect_ratio, "16:10");
  EXPECT_TRUE(info.has_image_size);
  EXPECT_EQ(info.image_width + "/" + info.image_height + "/" + info.image_diagonal, "47/30/22");
  EXPECT_TRUE(info.has_range_limits);
  EXPECT_EQ(info.h_freq.min + "-" + info.h_freq.max, "30-83");
  EXPECT_EQ(info.v_freq.min + "-" + info.v_freq.max, "56-76");
  EXPECT_EQ(info.serial_number, "G27");
  EXPECT_EQ(info.video_modes,
            (std::vector<std::string>{"1920 x 1200 (16:10)", "1280 x 960 (4:3)"}));
  EXPECT_EQ(edidDiagonalText(hexText(edid.data(), edid.size())), "22");
}

TEST(EdidTest, DigitalRevisionFourListsEncodingsAndRangeOffsets) {
  Block edid = blockWith({{18, 1},
                          {19, 4},
                          {20, 0xA5},  // digital, 8 bits, DisplayPort
                          {23, 0xFF},
                          {24, 0x18},
                          {12, 0x01},
                          {13, 0x02},
                          {54 + 3, 0xFD},
                          {54 + 4, 0x0A},  // maximum rates + 255
                          {54 + 5, 24},
                          {54 + 6, 5},
                          {54 + 7, 30},
                          {54 + 8, 45}});
  EdidInfo info;
  ASSERT_TRUE(decodeEdid(edid.data(), edid.size(), &info));
  EXPECT_EQ(info.video_input, "Digital");
  EXPECT_EQ(info.synch_input, "");
  EXPECT_EQ(info.serial_digital, "1");
  EXPECT_EQ(info.color_features, "RGB 4:4:4, YCrCb 4:4:4, YCrCb 4:2:2");
  EXPECT_EQ(info.gamma, "");
  EXPECT_EQ(info.serial_number, "513");
  EXPECT_FALSE(info.has_image_size);
  EXPECT_EQ(info.aspect_ratio, "");
  EXPECT_EQ(info.v_freq.max, "260");
  EXPECT_EQ(info.h_freq.max, "300");
  EXPECT_EQ(info.h_freq.min, "30");
}

}  // namespace
}  // namespace cvn
