#include "collect/plist_converter.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>
#include <string>

#include "plist_path_reference.h"
#include "tree_text.h"

namespace cvn {
namespace {

// Sets TZ for the life of the object and restores the previous setting.
class ScopedZone {
 public:
  explicit ScopedZone(const char* zone) {
    const char* old = std::getenv("TZ");
    had_old_ = old != nullptr;
    if (had_old_) old_ = old;
    setenv("TZ", zone, 1);
    tzset();
  }
  ~ScopedZone() {
    if (had_old_) {
      setenv("TZ", old_.c_str(), 1);
    } else {
      unsetenv("TZ");
    }
    tzset();
  }

 private:
  bool had_old_ = false;
  std::string old_;
};

PlistValue parseOrDie(const std::string& document) {
  PlistValue value;
  EXPECT_TRUE(parsePlist(document, &value)) << document;
  return value;
}

std::string converted(const std::string& document) {
  TagTree tree(true, "Macintosh");
  PlistConverter(tree).convertPlist(parseOrDie(document));
  return treeText(&tree.top());
}

TEST(PlistConverterTest, ConvertsADataType) {
  ScopedZone zone("UTC0");
  EXPECT_EQ(converted(R"(<plist><array><dict>
    <key>_dataType</key><string>SPHardwareDataType</string>
    <key>_detailLevel</key><integer>-1</integer>
    <key>_properties</key><dict><key>x</key><string>y</string></dict>
    <key>_SPCompletionInterval</key><real>0.5</real>
    <key>_parentDataType</key><string>SPRootDataType</string>
    <key>_timeStamp</key><date>2013-11-15T20:30:00Z</date>
    <key>_versionNumber</key><integer>18446744073709551615</integer>
    <key>_items</key><array><dict>
      <key>machine_model</key><string>MacBook2,1</string>
      <key>number_processors</key><integer>2</integer>
      <key>Mac OS X, v10.6's disk</key><string>yes</string>
      <key>Ann’s ‘q‛/</key><string>q</string>
      <key>flag</key><true/>
      <key>blob</key><data>AAE=</data>
      <key>empty</key><dict/>
      <key>speed</key><real>1.5</real>
      <key>list</key><array><string>a</string><string>b</string><string>c</string></array>
      <key>nested</key><array><dict><key>k</key><integer>-3</integer></dict><array/></array>
    </dict></array>
  </dict></array></plist>)"),
            R"(+Macintosh=
+SPHardwareDataType=
_SPCompletionInterval=0.50
_parentDataType="SPRootDataType"
_timeStamp="20131115203000.000000+0"
_versionNumber="-1"
+_items=
+item0=
machine_model="MacBook2,1"
number_processors=2
Mac_OS_X__v10.6_s_disk="yes"
Ann_s__q__="q"
speed=1.50
+list=
item0="a"
item1="b"
item2="c"
-
+nested=
+item0=
k=-3
-
-
-
-
-
-
)");
}

TEST(PlistConverterTest, FirewallListsKeepTheirNumbersWithGaps) {
  EXPECT_EQ(converted(R"(<array><dict>
    <key>_dataType</key><string>SPFirewallDataType</string>
    <key>_items</key><array><dict>
      <key>spfirewall_applications</key><dict>
        <key>/Applications/A B.app</key><string>spfirewall_allow_all</string>
        <key>odd</key><integer>5</integer>
        <key>C's</key><string>spfirewall_block</string>
      </dict>
      <key>spfirewall_services</key><dict><key>ssh</key><true/></dict>
      <key>spfirewall_globalstate</key><string>spfirewall_globalstate_limit_connections</string>
    </dict></array>
    <key>spfirewall_services</key><dict><key>Remote Login</key><string>on</string></dict>
  </dict></array>)"),
            R"(+Macintosh=
+SPFirewallDataType=
+_items=
+item0=
spfirewall_globalstate="spfirewall_globalstate_limit_connections"
+spfirewall_applications=
+item0=
_name="/Applications/A B.app"
value="spfirewall_allow_all"
-
+item2=
_name="C's"
value="spfirewall_block"
-
-
-
-
+spfirewall_services=
Remote_Login="on"
-
-
-
)");
}

TEST(PlistConverterTest, SkipsLogsFontsAndOddElements) {
  EXPECT_EQ(converted(R"(<array>
    <dict><key>_dataType</key><string>SPLogsDataType</string>
      <key>_items</key><array><string>log</string></array></dict>
    <dict><key>_dataType</key><string>SPFontsDataType</string>
      <key>_items</key><array><string>font</string></array></dict>
    <dict><key>_items</key><array><string>no type</string></array></dict>
    <dict><key>_dataType</key><integer>3</integer><key>k</key><string>v</string></dict>
    <string>not a dictionary</string>
    <dict><key>_dataType</key><string>SPEmptyDataType</string>
      <key>_items</key><array><dict/></array><key>on</key><false/></dict>
  </array>)"),
            "*Macintosh=\n");
  EXPECT_EQ(converted("<dict><key>_dataType</key><string>SPX</string></dict>"), "*Macintosh=\n");
}

TEST(PlistConverterTest, DatesUseTheLongFormWithTheZoneInMinutes) {
  const std::string document = R"(<array><dict>
    <key>_dataType</key><string>SPX</string>
    <key>when</key><date>2013-11-15T20:30:00Z</date>
    <key>_items</key><array><date>2013-11-15T20:30:00Z</date></array>
  </dict></array>)";
  struct {
    const char* zone;
    const char* text;
  } cases[] = {
      {"UTC0", "20131115203000.000000+0"},
      {"CET-1CEST,M3.5.0,M10.5.0/3", "20131115213000.000000+60"},
      {"EST5EDT,M3.2.0,M11.1.0", "20131115153000.000000-300"},
      {"IST-5:30", "20131116020000.000000+330"},
  };
  for (const auto& c : cases) {
    ScopedZone zone(c.zone);
    std::string quoted = std::string("\"") + c.text + "\"";
    EXPECT_EQ(converted(document),
              "+Macintosh=\n+SPX=\nwhen=" + quoted + "\n+_items=\nitem0=" + quoted + "\n-\n-\n-\n")
        << c.zone;
  }
}

TEST(PlistConverterTest, SanitizesTheSevenCharacters) {
  EXPECT_EQ(PlistConverter::sanitizeKey("Mac OS X, v10.6's disk"), "Mac_OS_X__v10.6_s_disk");
  EXPECT_EQ(PlistConverter::sanitizeKey("a/b\xE2\x80\x99\xE2\x80\x98\xE2\x80\x9B\xE2\x80\x9C"),
            "a_b___\xE2\x80\x9C");
  EXPECT_EQ(PlistConverter::sanitizeKey("\xE2\x80"), "\xE2\x80");
}

// The converter walks with a cursor; storing every leaf by its full path
// must give the very same tree, down to the kinds of the tags.
TEST(PlistConverterTest, CursorWalkMatchesPathStoring) {
  const char* documents[] = {
      R"(<array>
        <dict><key>_dataType</key><string>SPA</string>
          <key>a b</key><dict><key>x</key><integer>1</integer></dict>
          <key>a_b</key><string>collides with the tag of the same name</string>
          <key>_items</key><array><string>s</string><dict/><array><array/></array>
            <dict><key>item0</key><string>shadow</string><key>v</key><real>2</real></dict>
          </array></dict>
        <dict><key>_dataType</key><string>SPA</string>
          <key>a b</key><dict><key>y</key><integer>2</integer></dict></dict>
        <dict><key>_dataType</key><string></string><key>k</key><string>v</string></dict>
        <dict><key>_dataType</key><string>a/b</string><key>k</key><string>v</string>
          <key>d</key><dict><key></key><string>empty key</string></dict></dict>
        <dict><key>_dataType</key><string>/lead</string><key>k</key><integer>4</integer></dict>
        <dict><key>_dataType</key><string>trail/</string>
          <key>k</key><array><dict><key>spfirewall_services</key>
            <dict><key>x</key><string>on</string></dict></dict></array></dict>
      </array>)",
  };
  for (const char* document : documents) {
    PlistValue root = parseOrDie(document);
    TagTree by_cursor(true, "Macintosh");
    PlistConverter(by_cursor).convertPlist(root);
    TagTree by_path(true, "Macintosh");
    reference::convertPlist(by_path, root);
    EXPECT_EQ(treeText(&by_cursor.document()), treeText(&by_path.document()));
  }

  PlistValue dictionary = parseOrDie(
      "<dict><key>a</key><string>1</string><key>d</key><dict><key>b</key><integer>2</integer>"
      "</dict><key>spfirewall_applications</key><dict><key>n</key><string>s</string></dict>"
      "</dict>");
  for (const char* path : {"", "/", "/x", "/x/", "x", "x//y", "/Macintosh"}) {
    TagTree by_cursor(true, "Macintosh");
    PlistConverter converter(by_cursor);
    converter.convertDictionary(dictionary, path);
    converter.convertArray(parseOrDie("<array><string>e</string></array>"), path);
    converter.convertNamedList(dictionary.dictionary[2].value, path);
    TagTree by_path(true, "Macintosh");
    reference::convertDictionary(by_path, dictionary, path);
    by_path.setValue(std::string(path) + "/item0", TagValue("e"));
    by_path.setValue(std::string(path) + "/item0/_name", TagValue("n"));
    by_path.setValue(std::string(path) + "/item0/value", TagValue("s"));
    EXPECT_EQ(treeText(&by_cursor.document()), treeText(&by_path.document())) << path;
  }
}

}  // namespace
}  // namespace cvn
