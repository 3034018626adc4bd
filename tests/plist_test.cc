#include "collect/plist.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

namespace cvn {
namespace {

// Compact rendering with the value kinds visible: s"text" (bytes outside
// printable ASCII as \xNN), i5, r1.50, d<epoch seconds>, b1, x<hex data>,
// [a,b] and {key:value,...}.
std::string plistText(const PlistValue& v) {
  char buf[64];
  switch (v.kind) {
    case PlistValue::Kind::kString: {
      std::string out = "s\"";
      for (unsigned char c : v.text) {
        if (c < 0x20 || c >= 0x7F || c == '\\') {
          std::snprintf(buf, sizeof buf, "\\x%02X", c);
          out += buf;
        } else {
          out += static_cast<char>(c);
        }
      }
      return out + "\"";
    }
    case PlistValue::Kind::kInteger:
      return "i" + std::to_string(v.integer);
    case PlistValue::Kind::kReal:
      std::snprintf(buf, sizeof buf, "r%.2f", v.real);
      return buf;
    case PlistValue::Kind::kDate:
      return "d" + std::to_string(v.integer);
    case PlistValue::Kind::kBoolean:
      return "b" + std::to_string(v.integer);
    case PlistValue::Kind::kData: {
      std::string out = "x";
      for (unsigned char c : v.text) {
        std::snprintf(buf, sizeof buf, "%02X", c);
        out += buf;
      }
      return out;
    }
    case PlistValue::Kind::kArray: {
      std::string out = "[";
      for (size_t i = 0; i < v.array.size(); ++i) out += (i ? "," : "") + plistText(v.array[i]);
      return out + "]";
    }
    case PlistValue::Kind::kDictionary: {
      std::string out = "{";
      for (size_t i = 0; i < v.dictionary.size(); ++i)
        out += (i ? "," : "") + v.dictionary[i].key + ":" + plistText(v.dictionary[i].value);
      return out + "}";
    }
  }
  return "?";
}

const char kHeader[] =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
    "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
    "<plist version=\"1.0\">\n";

// Parses `body` inside the usual header and renders the result; "false"
// when the reader gives up.
std::string parsed(const std::string& body) {
  PlistValue value;
  if (!parsePlist(std::string(kHeader) + body, &value)) return "false";
  return plistText(value);
}

// One value between two neighbours that must survive whatever it does.
std::string inDictionary(const std::string& element) {
  return parsed("<dict><key>a</key><string>A</string><key>v</key>" + element +
                "<key>z</key><true/></dict></plist>\n");
}

struct Case {
  const char* element;
  const char* expected_v;  // nullptr: the value and its key are dropped
};

void checkCases(const std::vector<Case>& cases) {
  for (const Case& c : cases) {
    std::string expected = c.expected_v ? std::string("{a:s\"A\",v:") + c.expected_v + ",z:b1}"
                                        : std::string("{a:s\"A\",z:b1}");
    EXPECT_EQ(inDictionary(c.element), expected) << c.element;
  }
}

TEST(PlistTest, IntegersReadAsCoreFoundationDoes) {
  checkCases({
      {"<integer>42</integer>", "i42"},
      {"<integer> \t\n7</integer>", "i7"},
      {"<integer>-5</integer>", "i-5"},
      {"<integer>+5</integer>", "i5"},
      {"<integer>- 5</integer>", "i-5"},
      {"<integer>000</integer>", "i0"},
      {"<integer>0x1F</integer>", "i31"},
      {"<integer>0XfF</integer>", "i255"},
      {"<integer>-0x10</integer>", "i-16"},
      {"<integer>9223372036854775807</integer>", "i9223372036854775807"},
      {"<integer>-9223372036854775808</integer>", "i-9223372036854775808"},
      {"<integer>9223372036854775808</integer>", "i-9223372036854775808"},
      {"<integer>18446744073709551615</integer>", "i-1"},
      {"<integer>0xFFFFFFFFFFFFFFFF</integer>", "i-1"},
      {"<integer>18446744073709551616</integer>", nullptr},
      {"<integer>-9223372036854775809</integer>", nullptr},
      {"<integer>5 </integer>", nullptr},
      {"<integer>1a</integer>", nullptr},
      {"<integer>0x</integer>", nullptr},
      {"<integer>1.5</integer>", nullptr},
      {"<integer></integer>", nullptr},
      {"<integer/>", nullptr},
  });
}

TEST(PlistTest, RealsReadAsCoreFoundationDoes) {
  checkCases({
      {"<real>1.5</real>", "r1.50"},
      {"<real>.5</real>", "r0.50"},
      {"<real>5.</real>", "r5.00"},
      {"<real>1E2</real>", "r100.00"},
      {"<real> +1.25</real>", "r1.25"},
      {"<real>NaN</real>", "rnan"},
      {"<real>-INF</real>", "r-inf"},
      {"<real>Infinity</real>", "rinf"},
      {"<real>1.5 </real>", nullptr},
      {"<real>0x1p3</real>", nullptr},
      {"<real>1,5</real>", nullptr},
      {"<real>-nan</real>", nullptr},
      {"<real/>", nullptr},
  });
}

TEST(PlistTest, DatesAreUtcInOneFormOnly) {
  checkCases({
      {"<date>2013-11-15T20:30:00Z</date>", "d1384547400"},
      {"<date>1970-01-01T00:00:00Z</date>", "d0"},
      {"<date>1969-12-31T23:59:59Z</date>", "d-1"},
      {"<date>2000-02-29T00:00:00Z</date>", "d951782400"},
      {"<date>0001-01-01T00:00:00Z</date>", "d-62135596800"},
      // Fields are converted, not checked: month 13 is next January.
      {"<date>2013-13-01T00:00:00Z</date>", "d1388534400"},
      {"<date>2013-11-15T20:30:00</date>", nullptr},
      {"<date>2013-11-15 20:30:00Z</date>", nullptr},
      {"<date>2013-11-15T20:30:00.5Z</date>", nullptr},
      {"<date>2013-11-15T20:30:00+01:00</date>", nullptr},
      {"<date/>", nullptr},
  });
}

TEST(PlistTest, OtherLeavesAndUnknownTags) {
  checkCases({
      {"<data>aGVs\nbG8=</data>", "x68656C6C6F"},
      {"<data></data>", "x"},
      {"<data/>", nullptr},
      {"<data>\xC3\xA9</data>", nullptr},
      {"<false/>", "b0"},
      {"<true></true>", "b1"},
      {"<string/>", "s\"\""},
      {"<dict/>", "{}"},
      {"<array></array>", "[]"},
      {"<blob>x</blob>", nullptr},
      {"<string>a<b/>c</string>", nullptr},
  });
}

TEST(PlistTest, StringsKeepTheirBytes) {
  checkCases({
      {"<string> a &lt;&gt;&amp;&apos;&quot; </string>", "s\" a <>&'\" \""},
      {"<string>&#65;&#x42;&#233;</string>", "s\"AB\\xC3\\xA9\""},
      {"<string><![CDATA[<b>&amp;\r\n]]></string>", "s\"<b>&amp;\\x0D\\x0A\""},
      {"<string>a\r\nb\rc</string>", "s\"a\\x0D\\x0Ab\\x0Dc\""},
      // Raw control characters, as profilers print them in part numbers.
      {"<string>M3\x01\x02\x1F\x7F</string>", "s\"M3\\x01\\x02\\x1F\\x7F\""},
      {"<string>&#0;&#1;&#x1f;&#13;</string>", "s\"\\x00\\x01\\x1F\\x0D\""},
      // Bytes that are not UTF-8 come through unchanged.
      {"<string>\xFF\xC3(\xED\xA0\x80</string>", "s\"\\xFF\\xC3(\\xED\\xA0\\x80\""},
      // Our own escape range in the input is not mistaken for escapes.
      {"<string>\xEF\x9C\x80\xEF\xA3\xBF&#xF701;</string>",
       "s\"\\xEF\\x9C\\x80\\xEF\\xA3\\xBF\\xEF\\x9C\\x81\""},
      {"<string>a]]>b</string>", "s\"a]]>b\""},
      {"<string>&nbsp;</string>", nullptr},
      {"<string>AT&T</string>", nullptr},
      {"<string>&#xD800;</string>", nullptr},
  });
  EXPECT_EQ(parsed("<dict><key>k\x01\r</key><string>v</string></dict>"), "{k\x01\r:s\"v\"}");
}

TEST(PlistTest, LineEndsAndCommentsOutsideValuesDoNotMatter) {
  std::string lf =
      "<?xml version=\"1.0\"?>\n<!-- made by hand \x01 -->\n<plist>\n<dict>\n"
      "<?pi x?><key>a</key>\n<!-- c -->\n<integer>1</integer>\n</dict>\n</plist>\n";
  std::string crlf;
  for (char c : lf) crlf += c == '\n' ? std::string("\r\n") : std::string(1, c);
  for (const std::string& doc : {lf, crlf}) {
    PlistValue value;
    std::string warning;
    ASSERT_TRUE(parsePlist(doc, &value, &warning));
    EXPECT_EQ(plistText(value), "{a:i1}");
    EXPECT_EQ(warning, "");
  }
}

TEST(PlistTest, RepeatedKeyKeepsFirstPositionAndLastValue) {
  std::string body = "<dict>";
  for (int i = 0; i < 40; ++i)
    body += "<key>k" + std::to_string(i) + "</key><integer>" + std::to_string(i) + "</integer>";
  body += "<key>k0</key><string>late</string><key>k39</key><integer>-1</integer></dict>";
  std::string text = parsed(body);
  EXPECT_EQ(text.substr(0, 20), "{k0:s\"late\",k1:i1,k2");
  EXPECT_EQ(text.substr(text.size() - 16), "k38:i38,k39:i-1}");
  EXPECT_EQ(parsed("<dict><key>a</key><integer>1</integer><key>b</key><integer>2</integer>"
                   "<key>a</key><integer>3</integer></dict>"),
            "{a:i3,b:i2}");
}

TEST(PlistTest, BrokenDocumentsKeepWhatWasRead) {
  struct {
    std::string body;
    const char* expected;
  } cases[] = {
      {"<array><dict><key>a</key><string>x</string><key>b</key><string>unfinished", "[{a:s\"x\"}]"},
      {"<array><string>x</string><dict><key>a</key><integer>1</integer></strin><string>y</string>",
       "[s\"x\",{a:i1}]"},
      {"<array><string>x</string></array><junk", "[s\"x\"]"},
      {"<array><string>x</string></array></plist>trailing & junk <", "[s\"x\"]"},
      {"<array><string>x", "[]"},
      // A key without a value, and a value without a key.
      {"<dict><key>a</key><key>b</key><integer>2</integer></dict>", "{b:i2}"},
      {"<dict><string>lost</string><key>c</key><integer>3</integer></dict>", "{c:i3}"},
  };
  for (const auto& c : cases) EXPECT_EQ(parsed(c.body), c.expected) << c.body;
}

TEST(PlistTest, OnlyDocumentsWithoutAnyValueFail) {
  for (std::string doc : {"", "foo", "{ a = b; }", "<plist/>", "<?xml version=\"1.0\"?>",
                          "<html><body>x</body></html>",
                          "<!DOCTYPE plist [<!ENTITY e \"x\">]><plist><string>&e;</string>"}) {
    PlistValue value;
    value.kind = PlistValue::Kind::kArray;
    value.array.resize(1);
    EXPECT_FALSE(parsePlist(doc, &value)) << doc;
    EXPECT_EQ(plistText(value), "s\"\"") << doc;
  }
  PlistValue value;
  ASSERT_TRUE(parsePlist("<array><integer>1</integer></array>", &value));
  EXPECT_EQ(plistText(value), "[i1]");
  ASSERT_TRUE(parsePlist(" \r\n<?xml version=\"1.0\"?><dict/>", &value));
  EXPECT_EQ(plistText(value), "{}");
}

TEST(PlistTest, NestingIsLimited) {
  std::string deep;
  for (int i = 0; i < 300; ++i) deep += "<array>";
  deep += "<string>bottom</string>";
  PlistValue value;
  ASSERT_TRUE(parsePlist(deep, &value));
  int depth = 0;
  const PlistValue* v = &value;
  while (v->isArray() && !v->array.empty()) {
    v = &v->array.front();
    ++depth;
  }
  EXPECT_EQ(depth, 255);  // 256 arrays, the innermost one empty
  // Far deeper input neither recurses nor exhausts anything.
  std::string hostile;
  for (int i = 0; i < 200000; ++i) hostile += "<dict><key>k</key>";
  EXPECT_TRUE(parsePlist(hostile, &value));
}

TEST(PlistTest, LargeDocumentsParse) {
  std::string doc = "<array>";
  std::string big(8 << 20, 'x');
  doc += "<string>" + big + "</string>";
  for (int i = 0; i < 100000; ++i) doc += "<dict><key>n</key><integer>7</integer></dict>";
  doc += "</array>";
  PlistValue value;
  ASSERT_TRUE(parsePlist(doc, &value));
  ASSERT_EQ(value.array.size(), 100001u);
  EXPECT_EQ(value.array[0].text.size(), big.size());
  EXPECT_EQ(value.array[100000].find("n")->integer, 7);
}

}  // namespace
}  // namespace cvn
