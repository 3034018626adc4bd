#include "collect/plist.h"

#include <expat.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <unordered_map>
#include <utility>

namespace cvn {

const PlistValue* PlistValue::find(std::string_view key) const {
  if (kind != Kind::kDictionary) return nullptr;
  for (const PlistEntry& entry : dictionary)
    if (entry.key == key) return &entry.value;
  return nullptr;
}

namespace {

// ------------------------------------------------------------- cleaning
//
// Profilers print bytes that CoreFoundation takes but expat refuses (raw
// control characters, stray bytes that are not UTF-8) and CR bytes that expat
// would turn into LF. Before parsing, each such byte b in character data
// becomes the private-use character U+F700+b, and after parsing every
// U+F700..U+F7FF in a string or key turns back into its byte. Genuine
// characters of U+F700..U+F8FF in the input are escaped byte by byte the same
// way, so the round trip is lossless. U+F800 marks a value that
// CoreFoundation would refuse (an unknown entity, a broken reference); the
// reader drops that one value.

constexpr uint32_t kEscapeBase = 0xF700;
constexpr uint32_t kPoison = 0xF800;
constexpr uint32_t kPrivateLast = 0xF8FF;

void appendUtf8(std::string& out, uint32_t cp) {
  if (cp < 0x80) {
    out += static_cast<char>(cp);
  } else if (cp < 0x800) {
    out += static_cast<char>(0xC0 | (cp >> 6));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else if (cp < 0x10000) {
    out += static_cast<char>(0xE0 | (cp >> 12));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else {
    out += static_cast<char>(0xF0 | (cp >> 18));
    out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  }
}

void appendEscapedByte(std::string& out, unsigned char b) { appendUtf8(out, kEscapeBase + b); }

void appendEscapedCodePoint(std::string& out, uint32_t cp) {
  std::string bytes;
  appendUtf8(bytes, cp);
  for (char b : bytes) appendEscapedByte(out, static_cast<unsigned char>(b));
}

bool isContinuation(unsigned char b) { return (b & 0xC0) == 0x80; }

// Length of the UTF-8 sequence at p that expat accepts as one character, or
// 0 when the bytes are not such a sequence.
size_t sequenceLength(const unsigned char* p, size_t n, uint32_t* cp) {
  unsigned char b = p[0];
  size_t len;
  unsigned char lo = 0x80, hi = 0xBF;
  if (b >= 0xC2 && b <= 0xDF) {
    len = 2;
  } else if (b >= 0xE0 && b <= 0xEF) {
    len = 3;
    if (b == 0xE0) lo = 0xA0;
    if (b == 0xED) hi = 0x9F;  // surrogates
  } else if (b >= 0xF0 && b <= 0xF4) {
    len = 4;
    if (b == 0xF0) lo = 0x90;
    if (b == 0xF4) hi = 0x8F;
  } else {
    return 0;
  }
  if (n < len || p[1] < lo || p[1] > hi) return 0;
  for (size_t k = 2; k < len; ++k)
    if (!isContinuation(p[k])) return 0;
  uint32_t value = b & (len == 2 ? 0x1F : len == 3 ? 0x0F : 0x07);
  for (size_t k = 1; k < len; ++k) value = (value << 6) | (p[k] & 0x3F);
  if (value == 0xFFFE || value == 0xFFFF) return 0;  // not XML characters
  *cp = value;
  return len;
}

bool isXmlChar(uint32_t cp) {
  if (cp < 0x20) return cp == 0x09 || cp == 0x0A || cp == 0x0D;
  if (cp >= 0xD800 && cp <= 0xDFFF) return false;
  if (cp == 0xFFFE || cp == 0xFFFF) return false;
  return cp <= 0x10FFFF;
}

class Cleaner {
 public:
  explicit Cleaner(std::string_view in)
      : p_(reinterpret_cast<const unsigned char*>(in.data())), n_(in.size()) {}

  std::string run();

 private:
  enum class State { kText, kTag, kComment, kProcessing, kCData, kDeclaration };

  bool startsWith(const char* s) const {
    size_t len = std::strlen(s);
    return n_ - i_ >= len && std::memcmp(p_ + i_, s, len) == 0;
  }
  void copy(size_t len) {
    out_.append(reinterpret_cast<const char*>(p_ + i_), len);
    i_ += len;
  }
  // One character of content: control bytes, stray bytes and our own private
  // range are escaped, everything else is copied.
  void copyContentByte(bool escape_cr);
  void copyReference();

  const unsigned char* p_;
  size_t n_;
  size_t i_ = 0;
  std::string out_;
};

void Cleaner::copyContentByte(bool escape_cr) {
  unsigned char c = p_[i_];
  if (c < 0x80) {
    bool refused = c < 0x20 && c != '\t' && c != '\n' && (c != '\r' || escape_cr);
    if (refused) {
      appendEscapedByte(out_, c);
    } else {
      out_ += static_cast<char>(c);
    }
    ++i_;
    return;
  }
  uint32_t cp = 0;
  size_t len = sequenceLength(p_ + i_, n_ - i_, &cp);
  if (len == 0) {
    appendEscapedByte(out_, c);
    ++i_;
  } else if (cp >= kEscapeBase && cp <= kPrivateLast) {
    for (size_t k = 0; k < len; ++k) appendEscapedByte(out_, p_[i_ + k]);
    i_ += len;
  } else {
    copy(len);
  }
}

void Cleaner::copyReference() {
  static const char* const kPredefined[] = {"&lt;", "&gt;", "&amp;", "&apos;", "&quot;"};
  for (const char* name : kPredefined) {
    if (startsWith(name)) {
      copy(std::strlen(name));
      return;
    }
  }
  if (startsWith("&#")) {
    size_t j = i_ + 2;
    bool hex = j < n_ && p_[j] == 'x';
    if (hex) ++j;
    uint32_t value = 0;
    size_t digits = 0;
    for (; j < n_ && digits <= 8; ++j, ++digits) {
      unsigned char c = p_[j];
      uint32_t d;
      if (c >= '0' && c <= '9') {
        d = c - '0';
      } else if (hex && c >= 'a' && c <= 'f') {
        d = c - 'a' + 10;
      } else if (hex && c >= 'A' && c <= 'F') {
        d = c - 'A' + 10;
      } else {
        break;
      }
      value = value * (hex ? 16 : 10) + d;
    }
    if (digits > 0 && digits <= 8 && j < n_ && p_[j] == ';') {
      size_t len = j + 1 - i_;
      if (value < 0x20 && value != '\t' && value != '\n' && value != '\r') {
        appendEscapedByte(out_, static_cast<unsigned char>(value));
        i_ += len;
        return;
      }
      if (value >= kEscapeBase && value <= kPrivateLast) {
        appendEscapedCodePoint(out_, value);
        i_ += len;
        return;
      }
      if (isXmlChar(value)) {
        copy(len);
        return;
      }
    }
  }
  // Anything else makes CoreFoundation refuse the value: mark it and let the
  // rest of the reference pass as plain text.
  appendUtf8(out_, kPoison);
  ++i_;
}

std::string Cleaner::run() {
  out_.reserve(n_ + n_ / 32 + 16);
  // CoreFoundation takes blanks before the declaration; expat does not.
  size_t lead = 0;
  while (lead < n_ && (p_[lead] == ' ' || p_[lead] == '\t' || p_[lead] == '\r' || p_[lead] == '\n'))
    ++lead;
  if (lead > 0 && n_ - lead >= 5 && std::memcmp(p_ + lead, "<?xml", 5) == 0) i_ = lead;

  State state = State::kText;
  bool root_started = false;
  unsigned char quote = 0;
  int brackets = 0;
  int closing_brackets = 0;  // "]" run in text, for "]]>"
  while (i_ < n_) {
    unsigned char c = p_[i_];
    switch (state) {
      case State::kText:
        if (c == '<') {
          closing_brackets = 0;
          if (startsWith("<!--")) {
            state = State::kComment;
            copy(4);
          } else if (startsWith("<![CDATA[")) {
            state = State::kCData;
            copy(9);
          } else if (startsWith("<?")) {
            state = State::kProcessing;
            copy(2);
          } else if (startsWith("<!")) {
            state = State::kDeclaration;
            brackets = 0;
            quote = 0;
            copy(2);
          } else {
            if (i_ + 1 < n_ && p_[i_ + 1] != '/') root_started = true;
            state = State::kTag;
            quote = 0;
            copy(1);
          }
        } else if (c == '&') {
          closing_brackets = 0;
          copyReference();
        } else if (c == '>' && closing_brackets >= 2) {
          closing_brackets = 0;
          appendEscapedByte(out_, c);
          ++i_;
        } else {
          closing_brackets = c == ']' ? closing_brackets + 1 : 0;
          // Blanks of the prolog are markup; CR there must stay a blank.
          copyContentByte(root_started);
        }
        break;
      case State::kCData:
        if (startsWith("]]>")) {
          state = State::kText;
          copy(3);
        } else {
          copyContentByte(true);
        }
        break;
      case State::kComment:
        if (startsWith("-->")) {
          state = State::kText;
          copy(3);
        } else {
          copyContentByte(false);
        }
        break;
      case State::kProcessing:
        if (startsWith("?>")) state = State::kText;
        copy(state == State::kText ? 2 : 1);
        break;
      case State::kTag:
        if (quote) {
          if (c == quote) quote = 0;
        } else if (c == '"' || c == '\'') {
          quote = c;
        } else if (c == '>') {
          state = State::kText;
        }
        copy(1);
        break;
      case State::kDeclaration:
        if (quote) {
          if (c == quote) quote = 0;
        } else if (c == '"' || c == '\'') {
          quote = c;
        } else if (c == '[') {
          ++brackets;
        } else if (c == ']') {
          --brackets;
        } else if (c == '>' && brackets <= 0) {
          state = State::kText;
        }
        copy(1);
        break;
    }
  }
  return std::move(out_);
}

// Turns escaped bytes back into bytes, in place. False when the text holds
// the mark of a value CoreFoundation would refuse.
bool restoreBytes(std::string& s) {
  size_t pos = s.find('\xEF');
  if (pos == std::string::npos) return true;
  size_t w = pos;
  bool clean = true;
  for (size_t r = pos; r < s.size();) {
    unsigned char b = static_cast<unsigned char>(s[r]);
    if (b == 0xEF && r + 2 < s.size()) {
      unsigned char b1 = static_cast<unsigned char>(s[r + 1]);
      unsigned char b2 = static_cast<unsigned char>(s[r + 2]);
      if (b1 >= 0x9C && b1 <= 0x9F && isContinuation(b2)) {
        s[w++] = static_cast<char>(((b1 & 0x03) << 6) | (b2 & 0x3F));
        r += 3;
        continue;
      }
      if (b1 >= 0xA0 && b1 <= 0xA3 && isContinuation(b2)) clean = false;
    }
    s[w++] = s[r++];
  }
  s.resize(w);
  return clean;
}

// ------------------------------------------------------------ leaf values

// Bytes that CoreFoundation skips as blanks around numbers.
bool isNumberBlank(unsigned char c) { return c < 0x21 || (c >= 0x7F && c <= 0xA0); }

bool parseInteger(std::string_view s, int64_t* out) {
  size_t i = 0;
  auto skipBlanks = [&] {
    while (i < s.size() && isNumberBlank(static_cast<unsigned char>(s[i]))) ++i;
  };
  skipBlanks();
  bool negative = false;
  if (i < s.size() && (s[i] == '-' || s[i] == '+')) {
    negative = s[i] == '-';
    ++i;
    skipBlanks();
  }
  bool hex = false;
  if (s.size() - i >= 2 && s[i] == '0' && (s[i + 1] == 'x' || s[i + 1] == 'X')) {
    hex = true;
    i += 2;
  }
  if (i == s.size()) return false;
  uint64_t value = 0;
  constexpr uint64_t kMax = std::numeric_limits<uint64_t>::max();
  unsigned base = hex ? 16 : 10;
  for (; i < s.size(); ++i) {
    char c = s[i];
    unsigned d;
    if (c >= '0' && c <= '9') {
      d = c - '0';
    } else if (hex && c >= 'a' && c <= 'f') {
      d = c - 'a' + 10;
    } else if (hex && c >= 'A' && c <= 'F') {
      d = c - 'A' + 10;
    } else {
      return false;
    }
    if (value > (kMax - d) / base) return false;
    value = value * base + d;
  }
  constexpr uint64_t kMinMagnitude = uint64_t{1} << 63;
  if (negative) {
    if (value > kMinMagnitude) return false;
    value = 0 - value;
  }
  // Literals above 2^63-1 keep their low 64 bits, as CoreFoundation reads
  // them back; the conversion is modular.
  *out = static_cast<int64_t>(value);
  return true;
}

bool equalsIgnoringCase(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    char x = a[i];
    if (x >= 'A' && x <= 'Z') x = static_cast<char>(x - 'A' + 'a');
    if (x != b[i]) return false;
  }
  return true;
}

bool parseReal(std::string_view s, double* out) {
  constexpr double kInf = std::numeric_limits<double>::infinity();
  if (equalsIgnoringCase(s, "nan")) {
    *out = std::numeric_limits<double>::quiet_NaN();
    return true;
  }
  for (const char* name : {"inf", "+inf", "infinity", "+infinity"}) {
    if (equalsIgnoringCase(s, name)) {
      *out = kInf;
      return true;
    }
  }
  for (const char* name : {"-inf", "-infinity"}) {
    if (equalsIgnoringCase(s, name)) {
      *out = -kInf;
      return true;
    }
  }
  size_t i = 0;
  while (i < s.size() && isNumberBlank(static_cast<unsigned char>(s[i]))) ++i;
  std::string digits(s.substr(i));
  if (digits.empty() || digits.find_first_not_of("+-.0123456789eE") != std::string::npos)
    return false;
  // The program never changes LC_NUMERIC, so strtod reads the C form.
  char* end = nullptr;
  double value = std::strtod(digits.c_str(), &end);
  if (end != digits.c_str() + digits.size()) return false;
  *out = value;
  return true;
}

int64_t daysFromCivil(int64_t y, int64_t m, int64_t d) {
  y -= m <= 2;
  const int64_t era = (y >= 0 ? y : y - 399) / 400;
  const int64_t yoe = y - era * 400;
  const int64_t doy = (153 * (m > 2 ? m - 3 : m + 9) + 2) / 5 + d - 1;
  const int64_t doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
  return era * 146097 + doe - 719468;
}

// The one form CoreFoundation reads: -?Y+-MM-DDTHH:MM:SSZ in UTC. Fields are
// not range-checked, only converted arithmetically.
bool parseDate(std::string_view s, int64_t* out) {
  size_t i = 0;
  bool negative = i < s.size() && s[i] == '-';
  if (negative) ++i;
  int64_t year = 0;
  size_t start = i;
  for (; i < s.size() && s[i] >= '0' && s[i] <= '9'; ++i) {
    if (i - start >= 9) return false;  // keeps the arithmetic far from overflow
    year = year * 10 + (s[i] - '0');
  }
  if (i == start) return false;
  if (negative) year = -year;
  int fields[4];  // month, day, hour, minute
  const char separators[4] = {'-', '-', 'T', ':'};
  for (int f = 0; f < 4; ++f) {
    if (s.size() - i < 3 || s[i] != separators[f]) return false;
    char a = s[i + 1], b = s[i + 2];
    if (a < '0' || a > '9' || b < '0' || b > '9') return false;
    fields[f] = (a - '0') * 10 + (b - '0');
    i += 3;
  }
  if (s.size() - i != 4 || s[i] != ':') return false;
  char a = s[i + 1], b = s[i + 2];
  if (a < '0' || a > '9' || b < '0' || b > '9' || s[i + 3] != 'Z') return false;
  int second = (a - '0') * 10 + (b - '0');
  // Month 0 or above 12 rolls into the neighbouring years.
  int64_t month_index = fields[0] - 1;
  int64_t year_shift = month_index >= 0 ? month_index / 12 : -1;
  int64_t month = month_index - year_shift * 12 + 1;
  int64_t days = daysFromCivil(year + year_shift, month, 1) + fields[1] - 1;
  *out = days * 86400 + int64_t{fields[2]} * 3600 + fields[3] * 60 + second;
  return true;
}

bool decodeBase64(std::string_view s, std::string* out) {
  uint32_t acc = 0;
  int bits = 0;
  for (char ch : s) {
    unsigned char c = static_cast<unsigned char>(ch);
    if (c >= 0x80) return false;
    int v;
    if (c >= 'A' && c <= 'Z') {
      v = c - 'A';
    } else if (c >= 'a' && c <= 'z') {
      v = c - 'a' + 26;
    } else if (c >= '0' && c <= '9') {
      v = c - '0' + 52;
    } else if (c == '+') {
      v = 62;
    } else if (c == '/') {
      v = 63;
    } else {
      continue;  // blanks, padding and stray punctuation are skipped
    }
    acc = (acc << 6) | static_cast<uint32_t>(v);
    bits += 6;
    if (bits >= 8) {
      bits -= 8;
      out->push_back(static_cast<char>((acc >> bits) & 0xFF));
      acc &= (1u << bits) - 1;
    }
  }
  return true;
}

// ---------------------------------------------------------------- reader

constexpr size_t kMaxDepth = 256;
constexpr size_t kChunkSize = 1 << 20;
constexpr size_t kIndexThreshold = 16;

enum class Element {
  kPlist,
  kArray,
  kDict,
  kKey,
  kString,
  kInteger,
  kReal,
  kDate,
  kTrue,
  kFalse,
  kData,
  kUnknown
};

Element elementOf(const char* name) {
  static const std::pair<const char*, Element> kNames[] = {
      {"plist", Element::kPlist}, {"array", Element::kArray},   {"dict", Element::kDict},
      {"key", Element::kKey},     {"string", Element::kString}, {"integer", Element::kInteger},
      {"real", Element::kReal},   {"date", Element::kDate},     {"true", Element::kTrue},
      {"false", Element::kFalse}, {"data", Element::kData}};
  for (const auto& entry : kNames)
    if (std::strcmp(name, entry.first) == 0) return entry.second;
  return Element::kUnknown;
}

struct Frame {
  PlistValue value;  // kArray or kDictionary
  std::string key;
  bool has_key = false;
  bool key_refused = false;
  std::unique_ptr<std::unordered_map<std::string, size_t>> index;
};

class Reader {
 public:
  bool read(std::string_view document, PlistValue* out, std::string* warning);

 private:
  static void XMLCALL onStart(void* self, const XML_Char* name, const XML_Char** attributes);
  static void XMLCALL onEnd(void* self, const XML_Char* name);
  static void XMLCALL onText(void* self, const XML_Char* text, int len);
  static void XMLCALL onEntityDeclaration(void* self, const XML_Char*, int, const XML_Char*, int,
                                          const XML_Char*, const XML_Char*, const XML_Char*,
                                          const XML_Char*);

  void start(const char* name);
  void end();
  void finishLeaf();
  void attach(PlistValue&& value);
  void drop(const char* why);
  void insert(Frame& frame, std::string&& key, PlistValue&& value);
  void note(const std::string& problem);

  XML_Parser parser_ = nullptr;
  std::vector<Frame> stack_;
  // The leaf element being read, if any; leaves never nest.
  bool in_leaf_ = false;
  Element leaf_ = Element::kUnknown;
  bool leaf_refused_ = false;
  std::string text_;
  // Depth inside an element whose value is dropped as a whole.
  size_t ignored_ = 0;
  bool in_plist_ = false;
  bool root_done_ = false;
  bool stopped_for_entity_ = false;
  PlistValue root_;
  std::string warning_;
};

void Reader::note(const std::string& problem) {
  if (warning_.empty()) {
    warning_ = problem;
    if (parser_) warning_ += " at line " + std::to_string(XML_GetCurrentLineNumber(parser_));
  }
}

void Reader::insert(Frame& frame, std::string&& key, PlistValue&& value) {
  std::vector<PlistEntry>& entries = frame.value.dictionary;
  if (frame.index) {
    auto found = frame.index->find(key);
    if (found != frame.index->end()) {
      entries[found->second].value = std::move(value);
      return;
    }
    frame.index->emplace(key, entries.size());
  } else {
    for (PlistEntry& entry : entries) {
      if (entry.key == key) {
        entry.value = std::move(value);
        return;
      }
    }
  }
  entries.push_back(PlistEntry{std::move(key), std::move(value)});
  if (!frame.index && entries.size() > kIndexThreshold) {
    frame.index = std::make_unique<std::unordered_map<std::string, size_t>>();
    for (size_t i = 0; i < entries.size(); ++i) frame.index->emplace(entries[i].key, i);
  }
}

void Reader::attach(PlistValue&& value) {
  if (stack_.empty()) {
    if (!root_done_) {
      root_ = std::move(value);
      root_done_ = true;
      // Whatever follows the first value is ignored, as CoreFoundation does.
      XML_StopParser(parser_, XML_FALSE);
    }
    return;
  }
  Frame& frame = stack_.back();
  if (frame.value.kind == PlistValue::Kind::kArray) {
    frame.value.array.push_back(std::move(value));
    return;
  }
  if (!frame.has_key) {
    note("value without a key");
    return;
  }
  frame.has_key = false;
  if (frame.key_refused) return;
  insert(frame, std::move(frame.key), std::move(value));
  frame.key.clear();
}

void Reader::drop(const char* why) {
  note(why);
  if (!stack_.empty() && stack_.back().value.kind == PlistValue::Kind::kDictionary)
    stack_.back().has_key = false;
}

void Reader::start(const char* name) {
  if (ignored_ > 0) {
    ++ignored_;
    return;
  }
  if (in_leaf_) {
    // Markup inside a leaf: CoreFoundation refuses the value.
    leaf_refused_ = true;
    ignored_ = 1;
    return;
  }
  Element element = elementOf(name);
  if (element == Element::kPlist && stack_.empty() && !in_plist_) {
    in_plist_ = true;
    return;
  }
  switch (element) {
    case Element::kArray:
    case Element::kDict:
      if (stack_.size() >= kMaxDepth) {
        drop("nesting too deep");
        ignored_ = 1;
        return;
      }
      stack_.emplace_back();
      stack_.back().value.kind =
          element == Element::kArray ? PlistValue::Kind::kArray : PlistValue::Kind::kDictionary;
      return;
    case Element::kPlist:
    case Element::kUnknown:
      drop("unknown element");
      ignored_ = 1;
      return;
    default:
      in_leaf_ = true;
      leaf_ = element;
      leaf_refused_ = false;
      text_.clear();
      return;
  }
}

void Reader::finishLeaf() {
  in_leaf_ = false;
  bool readable = restoreBytes(text_) && !leaf_refused_;
  if (leaf_ == Element::kKey) {
    if (stack_.empty() || stack_.back().value.kind != PlistValue::Kind::kDictionary) {
      note("key outside a dictionary");
      return;
    }
    Frame& frame = stack_.back();
    if (frame.has_key) note("key without a value");
    frame.has_key = true;
    frame.key_refused = !readable;
    if (!readable) note("unreadable key");
    frame.key = std::move(text_);
    text_.clear();
    return;
  }
  PlistValue value;
  switch (leaf_) {
    case Element::kString:
      value.kind = PlistValue::Kind::kString;
      value.text = std::move(text_);
      text_.clear();
      break;
    case Element::kInteger:
      value.kind = PlistValue::Kind::kInteger;
      readable = readable && parseInteger(text_, &value.integer);
      break;
    case Element::kReal:
      value.kind = PlistValue::Kind::kReal;
      readable = readable && parseReal(text_, &value.real);
      break;
    case Element::kDate:
      value.kind = PlistValue::Kind::kDate;
      readable = readable && parseDate(text_, &value.integer);
      break;
    case Element::kTrue:
    case Element::kFalse:
      value.kind = PlistValue::Kind::kBoolean;
      value.integer = leaf_ == Element::kTrue ? 1 : 0;
      readable = readable && text_.empty();
      break;
    case Element::kData:
      value.kind = PlistValue::Kind::kData;
      // "<data/>" is refused where "<data></data>" is empty data; expat
      // reports no bytes for the end of an empty-element tag.
      readable =
          readable && XML_GetCurrentByteCount(parser_) != 0 && decodeBase64(text_, &value.text);
      break;
    default:
      readable = false;
      break;
  }
  if (!readable) {
    drop("unreadable value");
    return;
  }
  attach(std::move(value));
}

void Reader::end() {
  if (ignored_ > 0) {
    --ignored_;
    return;
  }
  if (in_leaf_) {
    finishLeaf();
    return;
  }
  if (stack_.empty()) return;  // </plist>
  PlistValue value = std::move(stack_.back().value);
  stack_.pop_back();
  attach(std::move(value));
}

void XMLCALL Reader::onStart(void* self, const XML_Char* name, const XML_Char**) {
  static_cast<Reader*>(self)->start(name);
}

void XMLCALL Reader::onEnd(void* self, const XML_Char*) { static_cast<Reader*>(self)->end(); }

void XMLCALL Reader::onText(void* self, const XML_Char* text, int len) {
  Reader* reader = static_cast<Reader*>(self);
  if (reader->in_leaf_ && reader->ignored_ == 0) reader->text_.append(text, len);
}

void XMLCALL Reader::onEntityDeclaration(void* self, const XML_Char*, int, const XML_Char*, int,
                                         const XML_Char*, const XML_Char*, const XML_Char*,
                                         const XML_Char*) {
  // CoreFoundation refuses internal subsets, and expanding entities is only a risk.
  Reader* reader = static_cast<Reader*>(self);
  reader->stopped_for_entity_ = true;
  XML_StopParser(reader->parser_, XML_FALSE);
}

struct ParserFree {
  void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
};

bool Reader::read(std::string_view document, PlistValue* out, std::string* warning) {
  std::string cleaned = Cleaner(document).run();
  // The declared encoding is overridden: the cleaning works on UTF-8 bytes.
  std::unique_ptr<XML_ParserStruct, ParserFree> parser(XML_ParserCreate("UTF-8"));
  if (!parser) return false;
  parser_ = parser.get();
  XML_SetUserData(parser_, this);
  XML_SetElementHandler(parser_, &Reader::onStart, &Reader::onEnd);
  XML_SetCharacterDataHandler(parser_, &Reader::onText);
  XML_SetEntityDeclHandler(parser_, &Reader::onEntityDeclaration);

  const char* data = cleaned.data();
  size_t offset = 0;
  for (;;) {
    size_t len = std::min(kChunkSize, cleaned.size() - offset);
    bool final = offset + len == cleaned.size();
    if (XML_Parse(parser_, data + offset, static_cast<int>(len), final) != XML_STATUS_OK) {
      if (!root_done_) {
        note(stopped_for_entity_ ? std::string("entity declaration")
                                 : std::string(XML_ErrorString(XML_GetErrorCode(parser_))));
      }
      break;
    }
    offset += len;
    if (final) break;
  }
  if (!root_done_) {
    // The document broke off: keep what was read and close what is open.
    in_leaf_ = false;
    ignored_ = 0;
    while (!stack_.empty()) {
      PlistValue value = std::move(stack_.back().value);
      stack_.pop_back();
      attach(std::move(value));
    }
  }
  parser_ = nullptr;
  if (warning) *warning = warning_;
  if (!root_done_) {
    *out = PlistValue();
    return false;
  }
  *out = std::move(root_);
  return true;
}

}  // namespace

bool parsePlist(std::string_view document, PlistValue* out, std::string* warning) {
  Reader reader;
  return reader.read(document, out, warning);
}

const PlistValue* findProfilerItems(const PlistValue& root, std::string_view data_type) {
  if (!root.isArray()) return nullptr;
  for (const PlistValue& entry : root.array) {
    if (!entry.isDictionary()) continue;
    const PlistValue* type = entry.find("_dataType");
    if (!type || !type->isString() || type->text != data_type) continue;
    const PlistValue* items = entry.find("_items");
    return items && items->isArray() ? items : nullptr;
  }
  return nullptr;
}

}  // namespace cvn
