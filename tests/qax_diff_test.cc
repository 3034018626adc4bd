#include "qax_diff.h"

#include <gtest/gtest.h>

#include <string>

#include "qax_diff_text.h"

namespace cvn {
namespace {

// A result whose snapshot holds `sections`, ZXML lines below the top tag.
QaxFile result(const std::string& sections) {
  QaxFile file;
  file.blocks.emplace_back();
  file.blocks.back().type = "snapshot";
  std::string error;
  EXPECT_TRUE(parseZxmlText("\xEF\xBB\xBF?zxml\n+Snapshot=\n" + sections + "-\n",
                            &file.blocks.back().tree, nullptr, &error))
      << error;
  return file;
}

TEST(QaxDiffTest, RecordsPairWithWhatTheyStandFor) {
  const struct {
    std::string old_sections, new_sections, text;
  } cases[] = {
      // A device plugged in before the others renumbers them, not changes them.
      {"+USB=\n*Device:1=Mouse\nmanuf=Logitech\n*Device:2=Hub\n*Device:3=Hub\n-\n",
       "+USB=\n*Device:1=Keyboard\n*Device:2=Mouse\nmanuf=Logi\n*Device:3=Hub\n*Device:4=Hub\n-\n",
       "USB\n  + Device:1 \"Keyboard\"\n  ~ Device:2 (was Device:1)\n"
       "      manuf: \"Logitech\" -> \"Logi\"\n"},
      {"+Software=\n*Soft:Tool 4.10=Tool\nversion=4.10\n-\n",
       "+Software=\n*Soft:Tool 4.9=Tool\nversion=4.9\n-\n",
       "Software\n  ~ Soft:Tool 4.9 (Tool downgraded from 4.10 to 4.9)\n"},
      // Collected text must not reach the terminal as control sequences.
      {"+OS=\n*os:1=\nname=\x1b]0;x\x07 \xC2\x9B\xff\n-\n", "+OS=\n*os:1=\n-\n",
       "OS\n  ~ os:1\n      name: removed \"\\x1b]0;x\\x07 \\u009b\\xff\"\n"},
  };
  for (const auto& c : cases) {
    QaxDiff diff = diffQaxFiles(result(c.old_sections), result(c.new_sections), QaxDiffOptions());
    EXPECT_EQ(renderDiffText(diff), c.text) << c.new_sections;
  }
}

}  // namespace
}  // namespace cvn
