#include "zxml/format_text.h"

#include <cstdarg>
#include <cstdio>

namespace cvn {

std::string formatText(const char* format, ...) {
  va_list args;
  va_start(args, format);
  va_list copy;
  va_copy(copy, args);
  int n = std::vsnprintf(nullptr, 0, format, copy);
  va_end(copy);
  std::string out;
  if (n > 0) {
    out.resize(static_cast<size_t>(n) + 1);
    std::vsnprintf(&out[0], out.size(), format, args);
    out.resize(static_cast<size_t>(n));
  }
  va_end(args);
  return out;
}

size_t measureFormat(const char* format, ...) {
  va_list args;
  va_start(args, format);
  int n = std::vsnprintf(nullptr, 0, format, args);
  va_end(args);
  return n < 0 ? 0 : static_cast<size_t>(n);
}

}  // namespace cvn
