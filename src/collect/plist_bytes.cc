#include "collect/plist_bytes.h"

#include <cstdint>
#include <cstring>

#include "collect/plist_leaves.h"
#include "zxml/utf8_text.h"

namespace cvn {
namespace {

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

// Length of the UTF-8 sequence at p that expat accepts as one character, or
// 0 when the bytes are not such a sequence.
size_t sequenceLength(const unsigned char* p, size_t n, uint32_t* cp) {
  size_t len = utf8SequenceLength(p, n, cp);
  if (len == 0 || *cp == 0xFFFE || *cp == 0xFFFF) return 0;  // not XML characters
  return len;
}

bool isXmlChar(uint32_t cp) {
  if (cp < 0x20) return cp == 0x09 || cp == 0x0A || cp == 0x0D;
  if (cp >= 0xD800 && cp <= 0xDFFF) return false;
  if (cp == 0xFFFE || cp == 0xFFFF) return false;
  return cp <= 0x10FFFF;
}

// A control character that expat refuses even as a reference.
bool isRefusedControl(uint32_t cp) { return cp < 0x20 && cp != '\t' && cp != '\n' && cp != '\r'; }

// Length of the character reference ("&#65;", "&#x41;") at p, with its
// value, or 0 when there is none.
size_t characterReference(const unsigned char* p, size_t n, uint32_t* value) {
  if (n < 2 || p[0] != '&' || p[1] != '#') return 0;
  size_t j = 2;
  bool hex = j < n && p[j] == 'x';
  if (hex) ++j;
  uint32_t number = 0;
  size_t digits = 0;
  for (unsigned d = 0; j < n && digits <= 8 && digitValue(p[j], hex, &d); ++j, ++digits)
    number = number * (hex ? 16 : 10) + d;
  if (digits == 0 || digits > 8 || j >= n || p[j] != ';') return 0;
  *value = number;
  return j + 1;
}

// Length of the reference at p when it passes through as it is (a
// predefined entity, or a character expat takes outside our private
// range), else 0.
size_t keptReferenceLength(const unsigned char* p, size_t n) {
  static constexpr std::string_view kPredefined[] = {"&lt;", "&gt;", "&amp;", "&apos;", "&quot;"};
  for (std::string_view name : kPredefined) {
    if (n >= name.size() && std::memcmp(p, name.data(), name.size()) == 0) return name.size();
  }
  uint32_t value = 0;
  size_t len = characterReference(p, n, &value);
  if (len == 0 || isRefusedControl(value) || (value >= kEscapeBase && value <= kPrivateLast) ||
      !isXmlChar(value))
    return 0;
  return len;
}

// Bytes that pass through character data unchanged and end no state: most
// of a document. Runs of them are skipped, or copied, in one step.
struct PlainBytes {
  bool text[256] = {};
  bool markup[256] = {};
  constexpr PlainBytes() {
    for (int c = 0x20; c < 0x80; ++c) {
      text[c] = c != '<' && c != '&' && c != '>' && c != ']';
      markup[c] = c != '"' && c != '\'' && c != '>' && c != '[' && c != ']';
    }
    for (unsigned char c : {'\t', '\n'}) text[c] = markup[c] = true;
    markup[static_cast<unsigned char>('\r')] = true;
    for (int c = 0x80; c < 0x100; ++c) markup[c] = true;
  }
};
constexpr PlainBytes kPlain;

// Bytes after which the cleaning might change something, wherever they
// stand: control bytes (CR too), bytes outside ASCII, references and the
// "]" of a "]]>".
struct SuspectBytes {
  bool suspect[256] = {};
  constexpr SuspectBytes() {
    for (int c = 0; c < 0x20; ++c) suspect[c] = c != '\t' && c != '\n';
    for (int c = 0x80; c < 0x100; ++c) suspect[c] = true;
    suspect[static_cast<unsigned char>('&')] = true;
    suspect[static_cast<unsigned char>(']')] = true;
  }
};
constexpr SuspectBytes kSuspect;

// Whether any of the kBlock bytes at p is suspect, 16 bytes per compare
// through the vector types GCC and Clang share: this runs over nearly every
// byte of a profiler document, and a table lookup per byte cost most of the
// time saved by skipping the cleaning's walk.
typedef unsigned char Bytes16 __attribute__((vector_size(16)));
typedef signed char SignedBytes16 __attribute__((vector_size(16)));
constexpr size_t kBlock = 64;

bool blockHoldsSuspectByte(const unsigned char* p) {
  Bytes16 suspect = {};
  for (size_t k = 0; k < kBlock; k += sizeof(Bytes16)) {
    Bytes16 b;
    std::memcpy(&b, p + k, sizeof b);
    // Below 0x20 as a signed byte: the control bytes and every byte past
    // ASCII. Tab and LF are among them and are taken out again.
    const Bytes16 control =
        (Bytes16)((SignedBytes16)b < 0x20) ^ (Bytes16)(b == '\t') ^ (Bytes16)(b == '\n');
    suspect |= control | (Bytes16)(b == '&') | (Bytes16)(b == ']');
  }
  uint64_t halves[2];
  std::memcpy(halves, &suspect, sizeof halves);
  return (halves[0] | halves[1]) != 0;
}

// True when the cleaning certainly leaves p[0..n) as it is: no control
// byte, only well-formed UTF-8 outside our private range, only references
// that pass through and no "]]>". This holds for nearly every profiler
// document, and a run over plain bytes with no state to follow costs far
// less than the cleaning's walk from markup to text at every tag. Anything
// in doubt is left to the cleaning.
bool surelyUnchanged(const unsigned char* p, size_t n) {
  size_t i = 0;
  for (;;) {
    while (n - i >= kBlock && !blockHoldsSuspectByte(p + i)) i += kBlock;
    while (i < n && !kSuspect.suspect[p[i]]) ++i;
    if (i == n) return true;
    unsigned char c = p[i];
    if (c >= 0x80) {
      uint32_t cp = 0;
      size_t len = sequenceLength(p + i, n - i, &cp);
      if (len == 0 || (cp >= kEscapeBase && cp <= kPrivateLast)) return false;
      i += len;
    } else if (c == '&') {
      size_t len = keptReferenceLength(p + i, n - i);
      if (len == 0) return false;
      i += len;
    } else if (c == ']') {
      if (n - i >= 3 && p[i + 1] == ']' && p[i + 2] == '>') return false;
      ++i;
    } else {
      return false;
    }
  }
}

// Most documents need no escaping at all: the output is then the input
// itself, and nothing is copied until the first byte that changes.
class Cleaner {
 public:
  explicit Cleaner(std::string_view in)
      : p_(reinterpret_cast<const unsigned char*>(in.data())), n_(in.size()) {}

  /// The cleaned text: a view of the input, or of `storage` once a byte
  /// had to change.
  std::string_view run(std::string* storage);

 private:
  enum class State { kText, kTag, kComment, kProcessing, kCData, kDeclaration };

  bool startsWith(const char* s) const {
    size_t len = std::strlen(s);
    return n_ - i_ >= len && std::memcmp(p_ + i_, s, len) == 0;
  }
  void copy(size_t len) {
    if (changed_) out_->append(reinterpret_cast<const char*>(p_ + i_), len);
    i_ += len;
  }
  // The text up to here is the input's; from now on the output is built.
  std::string& change() {
    if (!changed_) {
      changed_ = true;
      out_->clear();
      out_->reserve(n_ - start_ + (n_ - start_) / 32 + 16);
      out_->append(reinterpret_cast<const char*>(p_ + start_), i_ - start_);
    }
    return *out_;
  }
  // A run of bytes for which `plain` holds, from the current one on.
  size_t plainRun(const bool* plain) const {
    size_t j = i_;
    while (j < n_ && plain[p_[j]]) ++j;
    return j - i_;
  }
  // One character of content: control bytes, stray bytes and our own private
  // range are escaped, everything else is copied.
  void copyContentByte(bool escape_cr);
  void copyReference();

  const unsigned char* p_;
  size_t n_;
  size_t i_ = 0;
  size_t start_ = 0;
  bool changed_ = false;
  std::string* out_ = nullptr;
};

void Cleaner::copyContentByte(bool escape_cr) {
  unsigned char c = p_[i_];
  if (c < 0x80) {
    bool refused = c < 0x20 && c != '\t' && c != '\n' && (c != '\r' || escape_cr);
    if (refused) {
      appendEscapedByte(change(), c);
      ++i_;
    } else {
      copy(1);
    }
    return;
  }
  uint32_t cp = 0;
  size_t len = sequenceLength(p_ + i_, n_ - i_, &cp);
  if (len == 0) {
    appendEscapedByte(change(), c);
    ++i_;
  } else if (cp >= kEscapeBase && cp <= kPrivateLast) {
    std::string& out = change();
    for (size_t k = 0; k < len; ++k) appendEscapedByte(out, p_[i_ + k]);
    i_ += len;
  } else {
    copy(len);
  }
}

void Cleaner::copyReference() {
  if (size_t len = keptReferenceLength(p_ + i_, n_ - i_)) {
    copy(len);
    return;
  }
  uint32_t value = 0;
  if (size_t len = characterReference(p_ + i_, n_ - i_, &value)) {
    if (isRefusedControl(value)) {
      appendEscapedByte(change(), static_cast<unsigned char>(value));
      i_ += len;
      return;
    }
    if (value >= kEscapeBase && value <= kPrivateLast) {
      appendEscapedCodePoint(change(), value);
      i_ += len;
      return;
    }
  }
  // Anything else makes CoreFoundation refuse the value: mark it and let the
  // rest of the reference pass as plain text.
  appendUtf8(change(), kPoison);
  ++i_;
}

std::string_view Cleaner::run(std::string* storage) {
  out_ = storage;
  // CoreFoundation takes blanks before the declaration; expat does not.
  size_t lead = 0;
  while (lead < n_ && (p_[lead] == ' ' || p_[lead] == '\t' || p_[lead] == '\r' || p_[lead] == '\n'))
    ++lead;
  if (lead > 0 && n_ - lead >= 5 && std::memcmp(p_ + lead, "<?xml", 5) == 0) i_ = lead;
  start_ = i_;
  if (surelyUnchanged(p_ + start_, n_ - start_))
    return std::string_view(reinterpret_cast<const char*>(p_ + start_), n_ - start_);

  State state = State::kText;
  bool root_started = false;
  unsigned char quote = 0;
  int brackets = 0;
  int closing_brackets = 0;  // "]" run in text, for "]]>"
  while (i_ < n_) {
    unsigned char c = p_[i_];
    switch (state) {
      case State::kText:
        if (kPlain.text[c]) {
          closing_brackets = 0;
          copy(plainRun(kPlain.text));
        } else if (c == '<') {
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
          appendEscapedByte(change(), c);
          ++i_;
        } else {
          closing_brackets = c == ']' ? closing_brackets + 1 : 0;
          // Blanks of the prolog are markup; CR there must stay a blank.
          copyContentByte(root_started);
        }
        break;
      case State::kCData:
      case State::kComment:
        // Character data either way; only CDATA keeps its CR bytes.
        if (startsWith(state == State::kCData ? "]]>" : "-->")) {
          state = State::kText;
          copy(3);
        } else {
          copyContentByte(state == State::kCData);
        }
        break;
      case State::kProcessing:
        if (startsWith("?>")) state = State::kText;
        copy(state == State::kText ? 2 : 1);
        break;
      case State::kTag:
      case State::kDeclaration:
        // Quoted text hides markup in both; only a declaration nests "[...]".
        if (!quote && kPlain.markup[c]) {
          copy(plainRun(kPlain.markup));
          break;
        }
        if (quote) {
          if (c == quote) quote = 0;
        } else if (c == '"' || c == '\'') {
          quote = c;
        } else if (state == State::kDeclaration && (c == '[' || c == ']')) {
          brackets += c == '[' ? 1 : -1;
        } else if (c == '>' && (state == State::kTag || brackets <= 0)) {
          state = State::kText;
        }
        copy(1);
        break;
    }
  }
  if (changed_) return *out_;
  return std::string_view(reinterpret_cast<const char*>(p_ + start_), n_ - start_);
}

}  // namespace

bool restoreEscapedBytes(std::string& s) {
  size_t pos = s.find('\xEF');
  if (pos == std::string::npos) return true;
  size_t w = pos;
  bool clean = true;
  for (size_t r = pos; r < s.size();) {
    unsigned char b = static_cast<unsigned char>(s[r]);
    if (b == 0xEF && r + 2 < s.size()) {
      unsigned char b1 = static_cast<unsigned char>(s[r + 1]);
      unsigned char b2 = static_cast<unsigned char>(s[r + 2]);
      if (b1 >= 0x9C && b1 <= 0x9F && isUtf8Continuation(b2)) {
        s[w++] = static_cast<char>(((b1 & 0x03) << 6) | (b2 & 0x3F));
        r += 3;
        continue;
      }
      if (b1 >= 0xA0 && b1 <= 0xA3 && isUtf8Continuation(b2)) clean = false;
    }
    s[w++] = s[r++];
  }
  s.resize(w);
  return clean;
}

std::string_view escapeRefusedBytes(std::string_view document, std::string* storage) {
  return Cleaner(document).run(storage);
}

}  // namespace cvn
