#include "collect/plist_converter.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "tree_text.h"

namespace cvn {
namespace {

// Skipped data types and keys, top-level integers as text but integers
// inside, sanitised keys, item numbers kept across dropped values, and a data
// type that comes twice landing in one tag.
TEST(PlistConverterTest, ConvertsTheDataTypes) {
  Plist root;
  ASSERT_TRUE(parsePlist(R"(<array>
    <dict><key>_dataType</key><string>SPLogsDataType</string><key>k</key><string>v</string></dict>
    <dict><key>_dataType</key><string>SPFontsDataType</string><key>k</key><string>v</string></dict>
    <dict><key>_dataType</key><integer>3</integer><key>k</key><string>v</string></dict><string/>
    <dict><key>_dataType</key><string>SPFirewallDataType</string>
      <key>_detailLevel</key><integer>-1</integer>
      <key>_properties</key><dict><key>x</key><string>y</string></dict>
      <key>_versionNumber</key><integer>18446744073709551615</integer>
      <key>_timeStamp</key><date>2013-11-15T20:30:00Z</date>
      <key>_items</key><array><dict>
        <key>Mac OS X, v10.6's ’‘‛“/x</key><integer>2</integer>
        <key>flag</key><true/><key>blob</key><data>AAE=</data><key>empty</key><dict/>
        <key>list</key><array><real>1.5</real><array/><date>2013-11-15T20:30:00Z</date></array>
        <key>spfirewall_applications</key><dict>
          <key>odd</key><integer>5</integer><key>/A B's.app</key><string>allow</string></dict>
      </dict></array></dict>
    <dict><key>_dataType</key><string>SPFirewallDataType</string>
      <key>_items</key><array><string>later</string></array></dict>
  </array>)",
                         &root));
  // Zone formatting itself is the date helper's; here only the long local form.
  const char* old_zone = std::getenv("TZ");
  std::string saved_zone = old_zone ? old_zone : "";
  setenv("TZ", "IST-5:30", 1);
  TagTree tree(true, "Macintosh");
  PlistConverter(tree).convertPlist(root);
  EXPECT_EQ(treeText(&tree.top()), R"(+Macintosh=
+SPFirewallDataType=
_versionNumber="-1"
_timeStamp="20131116020000.000000+330"
+_items=
item0="later"
+item0=
Mac_OS_X__v10.6_s____“_x=2
+list=
item0=1.50
item2="20131116020000.000000+330"
-
+spfirewall_applications=
+item1=
_name="/A B's.app"
value="allow"
-
-
-
-
-
-
)");
  old_zone ? setenv("TZ", saved_zone.c_str(), 1) : unsetenv("TZ");
}

}  // namespace
}  // namespace cvn
