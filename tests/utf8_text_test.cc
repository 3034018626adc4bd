// The one UTF-8 walker that the plist reader, the text cuts and the
// inspector's output share: what counts as one character, and where a cut
// may fall.
#include "zxml/utf8_text.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <utility>

namespace cvn {
namespace {

TEST(Utf8TextTest, SequencesFollowTheRangesOfWellFormedUtf8) {
  // The sequence's length and code point; 0 when it is not one character.
  const std::pair<std::string, const char*> cases[] = {
      {"A", "1 U+0041"},
      {"\xC2\x80", "2 U+0080"},
      {"\xC1\xBF", "0"},
      {"\xDF\xBF", "2 U+07FF"},
      {"\xE0\xA0\x80", "3 U+0800"},
      {"\xE0\x9F\xBF", "0"},
      {"\xED\x9F\xBF", "3 U+D7FF"},
      {"\xED\xA0\x80", "0"},
      {"\xEF\xBF\xBF", "3 U+FFFF"},
      {"\xF0\x90\x80\x80", "4 U+10000"},
      {"\xF0\x8F\xBF\xBF", "0"},
      {"\xF4\x8F\xBF\xBF", "4 U+10FFFF"},
      {"\xF4\x90\x80\x80", "0"},
      {"\xF5\x80\x80\x80", "0"},
      {"\xE2\x82", "0"},
      {"\xE2\x82\x41", "0"},
      {"\xF0\x90\x80\x41", "0"},
      {"\x80", "0"},
  };
  for (const auto& [bytes, expected] : cases) {
    uint32_t code_point = 0;
    const size_t length = utf8SequenceLength(reinterpret_cast<const unsigned char*>(bytes.data()),
                                             bytes.size(), &code_point);
    char shown[32];
    std::snprintf(shown, sizeof shown, length ? "%zu U+%04X" : "%zu", length, code_point);
    EXPECT_EQ(std::string(shown), expected) << bytes;
  }
}

TEST(Utf8TextTest, CutsBackOffToTheStartOfASplitCharacter) {
  const std::tuple<std::string, size_t, size_t> cases[] = {
      {"ab\xE2\x82\xAC", 9, 5},
      {"ab\xE2\x82\xAC", 4, 2},
      {"ab\xE2\x82\xAC", 3, 2},
      {"ab\xF0\x9F\x98\x80", 5, 2},
      {"abc", 2, 2},
      // Stray continuation bytes: at most three are given back.
      {"a\x80\x80\x80\x80\x80", 4, 1},
  };
  for (const auto& [text, limit, length] : cases)
    EXPECT_EQ(utf8CutLength(text, limit), length) << text << " at " << limit;
}

}  // namespace
}  // namespace cvn
