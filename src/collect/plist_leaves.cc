#include "collect/plist_leaves.h"

#include <cstdlib>
#include <limits>
#include <string>

#include "zxml/text_case.h"

namespace cvn {
namespace {

// Bytes that CoreFoundation skips as blanks around numbers.
bool isNumberBlank(unsigned char c) { return c < 0x21 || (c >= 0x7F && c <= 0xA0); }

int64_t daysFromCivil(int64_t y, int64_t m, int64_t d) {
  y -= m <= 2;
  const int64_t era = (y >= 0 ? y : y - 399) / 400;
  const int64_t yoe = y - era * 400;
  const int64_t doy = (153 * (m > 2 ? m - 3 : m + 9) + 2) / 5 + d - 1;
  const int64_t doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
  return era * 146097 + doe - 719468;
}

}  // namespace

bool digitValue(unsigned char c, bool hex, unsigned* value) {
  if (c >= '0' && c <= '9') {
    *value = c - '0';
  } else if (hex && c >= 'a' && c <= 'f') {
    *value = c - 'a' + 10;
  } else if (hex && c >= 'A' && c <= 'F') {
    *value = c - 'A' + 10;
  } else {
    return false;
  }
  return true;
}

bool parsePlistInteger(std::string_view s, int64_t* out) {
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
    unsigned d;
    if (!digitValue(static_cast<unsigned char>(s[i]), hex, &d)) return false;
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

bool parsePlistReal(std::string_view s, double* out) {
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

// The one form CoreFoundation reads: -?Y+-MM-DDTHH:MM:SSZ in UTC. Fields are
// not range-checked, only converted arithmetically.
bool parsePlistDate(std::string_view s, int64_t* out) {
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

bool decodePlistBase64(std::string_view s, std::string* out) {
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

}  // namespace cvn
