#include "collect/plist.h"

#include "collect/plist_leaves.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <optional>
#include <sstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cvn {
namespace {

// The value with its kind visible: s"text" and x"data" (bytes outside
// printable ASCII as \xNN), i5, r1.50, d<epoch seconds>, b1, [a,b], {key:value}.
std::string plistText(const PlistValue& v) {
  using Kind = PlistValue::Kind;
  std::string out;
  char buf[16];
  for (unsigned char c : v.text()) {
    std::snprintf(buf, sizeof buf, c >= 0x20 && c < 0x7F ? "%c" : "\\x%02X", c);
    out += buf;
  }
  for (const PlistValue& e : v.items()) out += "," + plistText(e);
  for (const PlistEntry& e : v.entries())
    out += "," + std::string(e.key) + ":" + plistText(e.value);
  std::string items = out.substr(out.empty() ? 0 : 1);
  std::snprintf(buf, sizeof buf, "%.2f", v.real());
  if (v.kind() == Kind::kString || v.kind() == Kind::kData)
    return (v.kind() == Kind::kString ? "s\"" : "x\"") + out + "\"";
  if (v.isArray()) return "[" + items + "]";
  if (v.isDictionary()) return "{" + items + "}";
  if (v.kind() == Kind::kReal) return std::string("r") + buf;
  return (v.kind() == Kind::kInteger ? "i"
          : v.kind() == Kind::kDate  ? "d"
                                     : "b") +
         std::to_string(v.integer());
}

// The rendering of `document`, or "false" when the reader gives up.
std::string parsed(const std::string& document) {
  Plist value;
  return parsePlist(document, &value) ? plistText(value) : "false";
}

TEST(PlistTest, ValueKinds) {
  // Each value sits between two neighbours that must survive whatever it
  // does; an expectation of "" means the value is dropped with its key.
  struct {
    const char* element;
    const char* expected;
  } cases[] = {{"<integer> \t\n42</integer>", "i42"},
               {"<integer>0x1F</integer>", "i31"},
               {"<integer>-9223372036854775808</integer>", "i-9223372036854775808"},
               {"<integer>9223372036854775808</integer>", "i-9223372036854775808"},
               {"<integer>18446744073709551615</integer>", "i-1"},
               {"<integer>18446744073709551616</integer>", ""},
               {"<integer>-9223372036854775809</integer>", ""},
               {"<integer>5 </integer>", ""},
               {"<integer/>", ""},
               {"<real> +1E2</real>", "r100.00"},
               {"<real>-INF</real>", "r-inf"},
               {"<real>1.5 </real>", ""},
               {"<date>2013-11-15T20:30:00Z</date>", "d1384547400"},
               {"<date>1969-12-31T23:59:59Z</date>", "d-1"},
               {"<date>2000-02-29T00:00:00Z</date>", "d951782400"},
               {"<date>2013-13-01T00:00:00Z</date>", "d1388534400"},  // converted, not checked
               {"<date>2013-11-15T20:30:00</date>", ""},
               {"<data>aGVs\nbG8=</data>", "x\"hello\""},
               {"<data></data>", "x\"\""},
               {"<data/>", ""},
               {"<data>\xC3\xA9</data>", ""},
               {"<blob>x</blob>", ""},
               {"<string>a<b/>c</string>", ""},
               {"<string> &lt;&amp;&apos;&quot;&#65;&#xE9;</string>", "s\" <&'\"A\\xC3\\xA9\""},
               {"<string><![CDATA[<b>&amp;]]>]]></string>", "s\"<b>&amp;]]>\""},
               {"<string><![CDATA[\r]]></string>", "s\"\\x0D\""},
               // CR, raw control bytes (as profilers print part numbers) and bytes
               // that are not UTF-8 are kept as they are, and so is our own escape
               // range.
               {"<string>a\r\nb\r\x01\x1F\x7F&#0;&#x1f;</string>",
                "s\"a\\x0D\\x0Ab\\x0D\\x01\\x1F\\x7F\\x00\\x1F\""},
               {"<string>\xFF\xC3(\xED\xA0\x80</string>", "s\"\\xFF\\xC3(\\xED\\xA0\\x80\""},
               {"<string>\xEF\x9C\x80&#xF701;</string>", "s\"\\xEF\\x9C\\x80\\xEF\\x9C\\x81\""},
               {"<string>&#00000065;&#x0000004A;&lt;\x01</string>", "s\"AJ<\\x01\""},
               {"<string>a&#9;b&#10;c&#13;</string>", "s\"a\\x09b\\x0Ac\\x0D\""},
               {"<string>&nbsp;</string>", ""},
               {"<string>&a1;</string>", ""},
               {"<string>&#xD800;</string>", ""}};
  for (const auto& c : cases) {
    std::string v = *c.expected ? std::string("v:") + c.expected + "," : "";
    EXPECT_EQ(parsed(std::string("<plist><dict><key>a</key><string>A</string><key>v</key>") +
                     c.element + "<key>z</key><true/></dict></plist>"),
              "{a:s\"A\"," + v + "z:b1}")
        << c.element;
  }
}

// Numbers as CoreFoundation reads them: its blanks around the sign, and the
// names it takes for reals that are no number.
TEST(PlistTest, NumbersTakeTheBlanksAndNamesCoreFoundationTakes) {
  const std::pair<std::string, const char*> cases[] = {
      {" \t\x7F\xA0-\xA0 5", "i-5 -"},
      {"\xA0 -2.5", "- r-2.50"},
      {"\xA1 5", "- -"},
      {"\x80+0x1F", "i31 -"},
      {"nAn", "- rnan"},
      {"-Infinity", "- r-inf"},
      {"+inf", "- rinf"},
  };
  for (const auto& [text, expected] : cases) {
    int64_t integer = 0;
    double real = 0;
    char shown[32] = "-";
    if (parsePlistReal(text, &real)) std::snprintf(shown, sizeof shown, "r%.2f", real);
    EXPECT_EQ(
        (parsePlistInteger(text, &integer) ? "i" + std::to_string(integer) : "-") + " " + shown,
        expected)
        << text;
  }
}

TEST(PlistTest, OddDocuments) {
  // Nesting is limited (the innermost of 256 arrays stays empty), and far
  // deeper input neither recurses nor exhausts anything.
  std::string deep, hostile, hostile_text;
  for (int i = 0; i < 300; ++i) deep += "<array>";
  for (int i = 0; i < 200000; ++i) hostile += "<dict><key>k</key>";
  for (int i = 0; i < 255; ++i) hostile_text += "{k:";
  struct {
    std::string document;
    std::string expected;
  } cases[] = {
      {deep + "<string>x</string>", std::string(256, '[') + std::string(256, ']')},
      {hostile, hostile_text + "{}" + std::string(255, '}')},
      // Breaks keep what was read, and the reader fails only without any value.
      {"<array><dict><key>a</key><string>x</string><key>b</key><string>cut", "[{a:s\"x\"}]"},
      {"<array><string>x</string><dict><key>a</key><integer>1</integer></strin><string>y",
       "[s\"x\",{a:i1}]"},
      {"<array><string>x", "[]"},
      {"", "false"},
      {"{ a = b; }", "false"},
      {"<plist/>", "false"},
      {"<!DOCTYPE plist [<!ENTITY e \"x\">]><plist><string>&e;</string>", "false"},
      // A key without a value, a value without a key, a repeated key.
      {"<dict><key>a</key><key>b</key><integer>2</integer><string>lost</string></dict>", "{b:i2}"},
      {"<dict><key>a</key><true/><key>b</key><true/><key>a</key><false/></dict>", "{a:b0,b:b1}"},
      {" \t\r\n<?xml version=\"1.0\"?><true/>", "b1"},
      {"<?xml version=\"1.0\"?>\r\n<!-- \x01 -->\r\n<?pi x?><dict><key>k\x01\r</key><true/></dict>",
       "{k\x01\r:b1}"},
  };
  for (const auto& c : cases) EXPECT_EQ(parsed(c.document), c.expected) << c.document.substr(0, 99);
}

TEST(PlistTest, BytesToCarryAreFoundAnywhereInALongDocument) {
  // A document with nothing to carry through expat is parsed as it is, so
  // every kind of byte that must be carried has to be noticed wherever it
  // stands in a long run of plain text.
  struct {
    const char* bytes;
    const char* shown;  // as plistText renders it; null: the value is refused
  } cases[] = {
      {"\x01", "\\x01"}, {"\r", "\\x0D"}, {"\xFF", "\\xFF"},  {"\xEF\x9C\x80", "\\xEF\\x9C\\x80"},
      {"&#1;", "\\x01"}, {"]]>", "]]>"},  {"&nbsp;", nullptr}};
  for (const auto& c : cases) {
    for (size_t before = 0; before <= 130; ++before) {
      const std::string head(before, 'a'), tail(130 - before, 'b');
      const std::string expected = c.shown ? "s\"" + head + c.shown + tail + "\"" : "false";
      ASSERT_EQ(parsed("<plist><string>" + head + c.bytes + tail + "</string></plist>"), expected)
          << c.bytes << " after " << before;
    }
  }
}

TEST(PlistTest, EveryAccessorAnswersForEveryKind) {
  // Readers ask without checking the kind first: a value of another kind
  // must read as empty, never as another member's bytes. Shown: text,
  // integer, real, items, entries, then the text at "a" found both ways.
  const std::pair<const char*, const char*> cases[] = {
      {"<string>s</string>", "s|0|0|0|0"},
      {"<data>aGk=</data>", "hi|0|0|0|0"},
      {"<integer>7</integer>", "|7|0|0|0"},
      {"<date>1970-01-01T00:01:00Z</date>", "|60|0|0|0"},
      {"<true/>", "|1|0|0|0"},
      {"<real>2.5</real>", "|0|2.5|0|0"},
      {"<array><string>a</string><string>b</string></array>", "|0|0|2|0"},
      {"<dict><key>a</key><string>x</string></dict>", "|0|0|0|1xx"},
  };
  for (const auto& [element, expected] : cases) {
    Plist v;
    ASSERT_TRUE(parsePlist(element, &v)) << element;
    std::ostringstream got;
    got << v.text() << "|" << v.integer() << "|" << v.real() << "|" << v.items().size() << "|"
        << v.entries().size() << v.findText("a").value_or("") << v.textAt("a");
    EXPECT_EQ(got.str(), expected) << element;
  }
  const PlistValue empty;
  EXPECT_TRUE(empty.isString() && empty.text().empty() && empty.entries().empty());
}

TEST(PlistTest, ValuesOutliveMovesAndMerges) {
  // Under the address sanitizer, a value left pointing into freed storage
  // fails here.
  Plist list;
  ASSERT_TRUE(
      parsePlist("<array><string>first</string><dict><key>k</key><integer>1</integer>"
                 "</dict></array>",
                 &list));
  const PlistValue* first = &list.items()[0];
  Plist moved = std::move(list);
  EXPECT_TRUE(list.isString() && list.items().empty());  // moved from: left empty
  EXPECT_EQ(first->text(), "first");

  for (const char* document : {"<array><string>second</string><string>skipped</string></array>",
                               "<array><string>third</string></array>"}) {
    Plist other;
    ASSERT_TRUE(parsePlist(document, &other));
    moved.appendItems({&other.items()[0]}, std::move(other));
    EXPECT_TRUE(other.items().empty());  // moved from: left empty
  }
  Plist target;
  target = std::move(moved);
  EXPECT_EQ(plistText(target), "[s\"first\",{k:i1},s\"second\",s\"third\"]");
}

TEST(PlistTest, RepeatedKeysAreStoredOnce) {
  Plist list;
  ASSERT_TRUE(
      parsePlist("<array><dict><key>_name</key><string>a</string></dict>"
                 "<dict><key>_name</key><string>b</string></dict></array>",
                 &list));
  EXPECT_EQ(list.items()[0].entries()[0].key.data(), list.items()[1].entries()[0].key.data());

  // More distinct keys than are shared, and a repeat of an early one after
  // them: every key still reads back, and the repeat keeps its position.
  std::string many = "<dict>";
  for (int i = 0; i < 5000; ++i)
    many += "<key>k" + std::to_string(i) + "</key><integer>" + std::to_string(i) + "</integer>";
  many += "<key>k3</key><string>again</string></dict>";
  ASSERT_TRUE(parsePlist(many, &list));
  ASSERT_EQ(list.entries().size(), 5000u);
  for (int i = 0; i < 5000; ++i) {
    const PlistEntry& entry = list.entries()[i];
    ASSERT_EQ(entry.key, "k" + std::to_string(i));
    if (i != 3) {
      ASSERT_EQ(entry.value.integer(), i);
    }
  }
  EXPECT_EQ(list.textAt("k3"), "again");
}

}  // namespace
}  // namespace cvn
