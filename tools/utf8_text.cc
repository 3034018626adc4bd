#include "utf8_text.h"

namespace cvn {

size_t utf8SequenceLength(std::string_view text, size_t at) {
  unsigned char c = static_cast<unsigned char>(text[at]);
  if (c < 0x80) return 1;
  size_t length = c >= 0xC2 && c <= 0xDF   ? 2
                  : c >= 0xE0 && c <= 0xEF ? 3
                  : c >= 0xF0 && c <= 0xF4 ? 4
                                           : 0;
  if (length == 0 || at + length > text.size()) return 0;
  for (size_t k = 1; k < length; ++k)
    if ((static_cast<unsigned char>(text[at + k]) & 0xC0) != 0x80) return 0;
  unsigned char c1 = static_cast<unsigned char>(text[at + 1]);
  // Overlong forms, UTF-16 surrogates and code points past U+10FFFF.
  if ((c == 0xE0 && c1 < 0xA0) || (c == 0xED && c1 >= 0xA0) || (c == 0xF0 && c1 < 0x90) ||
      (c == 0xF4 && c1 >= 0x90))
    return 0;
  return length;
}

uint32_t utf8CodePoint(std::string_view text, size_t at, size_t length) {
  static const unsigned char kLeadMask[] = {0, 0x7F, 0x1F, 0x0F, 0x07};
  uint32_t cp = static_cast<unsigned char>(text[at]) & kLeadMask[length];
  for (size_t k = 1; k < length; ++k)
    cp = (cp << 6) | (static_cast<unsigned char>(text[at + k]) & 0x3F);
  return cp;
}

std::string terminalText(std::string_view text, bool quoted) {
  static const char kHex[] = "0123456789abcdef";
  std::string out;
  out.reserve(text.size() + 2);
  if (quoted) out += '"';
  size_t i = 0;
  while (i < text.size()) {
    unsigned char c = static_cast<unsigned char>(text[i]);
    size_t length = utf8SequenceLength(text, i);
    uint32_t cp = length ? utf8CodePoint(text, i, length) : c;
    if (length && cp >= 0x20 && cp != 0x7F && !(cp >= 0x80 && cp < 0xA0)) {
      if (quoted && (c == '"' || c == '\\')) out += '\\';
      out.append(text, i, length);
      i += length;
      continue;
    }
    if (c == '\n') {
      out += "\\n";
    } else if (c == '\t') {
      out += "\\t";
    } else if (length == 2) {
      // C1 controls: some terminals take U+009B for the start of a sequence.
      out += "\\u00";
      out += kHex[cp >> 4];
      out += kHex[cp & 15];
    } else {
      out += "\\x";
      out += kHex[c >> 4];
      out += kHex[c & 15];
    }
    i += length ? length : 1;
  }
  if (quoted) out += '"';
  return out;
}

}  // namespace cvn
