#include "zxml/utf8_text.h"

namespace cvn {

size_t utf8SequenceLength(const unsigned char* p, size_t n, uint32_t* code_point) {
  if (n == 0) return 0;
  unsigned char b = p[0];
  if (b < 0x80) {
    *code_point = b;
    return 1;
  }
  size_t len;
  // The second byte's range rules out overlong forms (E0, F0), surrogates
  // (ED) and values past U+10FFFF (F4).
  unsigned char lo = 0x80, hi = 0xBF;
  if (b >= 0xC2 && b <= 0xDF) {
    len = 2;
  } else if (b >= 0xE0 && b <= 0xEF) {
    len = 3;
    if (b == 0xE0) lo = 0xA0;
    if (b == 0xED) hi = 0x9F;
  } else if (b >= 0xF0 && b <= 0xF4) {
    len = 4;
    if (b == 0xF0) lo = 0x90;
    if (b == 0xF4) hi = 0x8F;
  } else {
    return 0;
  }
  if (n < len || p[1] < lo || p[1] > hi) return 0;
  for (size_t k = 2; k < len; ++k)
    if (!isUtf8Continuation(p[k])) return 0;
  uint32_t value = b & (len == 2 ? 0x1F : len == 3 ? 0x0F : 0x07);
  for (size_t k = 1; k < len; ++k) value = (value << 6) | (p[k] & 0x3F);
  *code_point = value;
  return len;
}

size_t utf8CutLength(std::string_view text, size_t limit) {
  if (text.size() <= limit) return text.size();
  size_t n = limit;
  for (int back = 0; back < 3 && n > 0 && isUtf8Continuation(static_cast<unsigned char>(text[n]));
       ++back)
    --n;
  return n;
}

}  // namespace cvn
