#include "collect/plist.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

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
               // CR, raw control bytes (as profilers print part numbers) and bytes
               // that are not UTF-8 are kept as they are, and so is our own escape
               // range.
               {"<string>a\r\nb\r\x01\x1F\x7F&#0;&#x1f;</string>",
                "s\"a\\x0D\\x0Ab\\x0D\\x01\\x1F\\x7F\\x00\\x1F\""},
               {"<string>\xFF\xC3(\xED\xA0\x80</string>", "s\"\\xFF\\xC3(\\xED\\xA0\\x80\""},
               {"<string>\xEF\x9C\x80&#xF701;</string>", "s\"\\xEF\\x9C\\x80\\xEF\\x9C\\x81\""},
               {"<string>&nbsp;</string>", ""},
               {"<string>&#xD800;</string>", ""}};
  for (const auto& c : cases) {
    std::string v = *c.expected ? std::string("v:") + c.expected + "," : "";
    EXPECT_EQ(parsed(std::string("<plist><dict><key>a</key><string>A</string><key>v</key>") +
                     c.element + "<key>z</key><true/></dict></plist>"),
              "{a:s\"A\"," + v + "z:b1}")
        << c.element;
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
      {"<?xml version=\"1.0\"?>\r\n<!-- \x01 -->\r\n<?pi x?><dict><key>k\x01\r</key><true/></dict>",
       "{k\x01\r:b1}"},
  };
  for (const auto& c : cases) EXPECT_EQ(parsed(c.document), c.expected) << c.document.substr(0, 99);
}

}  // namespace
}  // namespace cvn
