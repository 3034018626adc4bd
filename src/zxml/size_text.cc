#include "zxml/size_text.h"

#include <cmath>
#include <cstdio>
#include <string>

namespace cvn {
namespace {

struct ParsedSize {
  double number = 0.0;
  std::string unit;
};

ParsedSize parseSize(std::string_view text) {
  ParsedSize parsed;
  if (text.size() < 3) return parsed;
  std::string copy(text);
  for (char& c : copy)
    if (c == ',') c = '.';
  parsed.unit = copy.substr(copy.size() - 2);
  copy.resize(copy.size() - 3);
  // "%lf" semantics: leading blanks skipped, the longest numeric prefix read.
  if (std::sscanf(copy.c_str(), "%lf", &parsed.number) != 1) parsed.number = 0.0;
  // "%lf" also reads "nan" and "inf"; no size of a real device is either,
  // and neither may reach the inventory as a number.
  if (!std::isfinite(parsed.number)) parsed.number = 0.0;
  return parsed;
}

}  // namespace

double SizeText::toKilobytes(std::string_view text) {
  ParsedSize p = parseSize(text);
  if (p.unit == "KB") return p.number;
  if (p.unit == "MB") return p.number * 1024.0;
  if (p.unit == "GB") return p.number * 1048576.0;
  if (p.unit == "TB") return p.number * 1073741824.0;
  return 0.0;
}

double SizeText::toGigabytes(std::string_view text) {
  ParsedSize p = parseSize(text);
  if (p.unit == "KB") return p.number / 1048576.0;
  if (p.unit == "MB") return p.number / 1024.0;
  if (p.unit == "GB") return p.number;
  if (p.unit == "TB") return p.number * 1000.0;
  return 0.0;
}

int64_t SizeText::toBytes(std::string_view text) {
  double bytes = toGigabytes(text) * 1073741824.0;
  // Out-of-range doubles must not reach the integer conversion (UB).
  if (!(bytes > -9.2e18 && bytes < 9.2e18)) return 0;
  return static_cast<int64_t>(bytes);
}

double SizeText::toDecimalGigabytes(std::string_view text, bool round) {
  double bytes = toGigabytes(text) * 1073741824.0;
  double gigabytes = bytes / 1000 / 10000000 * 10;
  if (!round) return gigabytes;
  if (!(gigabytes > -9.2e18 && gigabytes < 9.2e18)) return 0.0;
  double whole = static_cast<double>(static_cast<int64_t>(gigabytes));
  if (gigabytes - whole > 0.4) whole += 1.0;
  return whole;
}

}  // namespace cvn
